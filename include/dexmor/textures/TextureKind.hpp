#pragma once
// What the texture kinds share.
//
// A texture kind is described by data kept beside its class:
//   - kInfo: its kind id, the record version it writes (readers accept 1 to that
//     version), its plugin type, and two layout facts of its record;
//   - members(): its member objects (UVW generators, bitmaps, textures, the sky's
//     sun), each mandatory or optional and stored from some record version on;
//   - fields(): its plain fields as a record table (archive/Record.hpp);
//   - parameters(): its XML parameters in emission order; a parameter that refers
//     to a member carries the name of the member's child asset.
// From these tables follow, once for all kinds:
//   record:     VersionWord (0, version), then the members and the fields (the
//               members first unless kInfo says otherwise). A mandatory member is
//               its Int32 kind id and its record; an optional member a Bool
//               present flag, then, when present, kind id and record.
//   reading:    the version word, a reset to the defaults, then the items that
//               version holds. Fields an older version lacks keep their defaults.
//   writing:    refused, before anything is written, while a mandatory member is
//               empty.
//   XML:        the child asset of every member first, each under the texture's
//               url + "/" + its child name; then the texture's own asset of type
//               "texture", whose "plugin" parameters name the plugin inside each
//               child asset (child url + "/" + the member's plugin type).
//   comparison: same kind, members equal by their own comparison (both absent
//               or both present and equal), every field exactly equal.
//   copy:       clone() copies every field and replaces each member by its clone.
// Kinds whose records are irregular (the bitmap texture, the blend texture, the
// sky) override the record operations and keep the rest.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>
#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <span>
#include <string>
#include <type_traits>
#include <vector>

namespace OrvexKavorCore {

// The fixed facts of a texture kind.
struct TextureKindInfo {
    std::int32_t kind;      // the kind id under which the factory creates it
    std::uint16_t version;  // the record version written; readers accept 1 to it
    const char* pluginType; // the renderer plugin ("TexChecker")
    const char* what;       // the kind in failure reports ("checker texture")
    // Whether the members stand before the plain fields in the record.
    bool membersFirst = true;
    // Whether the version word is written before the check of the mandatory
    // members (a refused write then leaves the version word behind).
    bool versionBeforeCheck = false;
};

namespace texture {

// One member object of a texture: a shared pointer to a family base.
template <class Tex>
struct Member {
    const char* name;
    bool optional;
    record::Versions versions;
    bool (*read)(QuickArchive& ar, Tex& t, const char* name, bool optional);
    bool (*write)(QuickArchive& ar, const Tex& t, bool optional);
    bool (*isSet)(const Tex& t);
    bool (*equal)(const Tex& a, const Tex& b);
    void (*separate)(Tex& t); // replaces the member by its deep copy
    void (*take)(Tex& t, std::vector<TexturePtr>& out);
};

template <class M>
struct MemberTraits;
template <class C, class P>
struct MemberTraits<P C::*> {
    using Class = C;
    using Pointer = P;
};

template <auto M>
constexpr auto member(const char* name, bool optional, record::Versions versions) {
    using Tex = typename MemberTraits<decltype(M)>::Class;
    using Pointer = typename MemberTraits<decltype(M)>::Pointer;
    return Member<Tex>{
        name,
        optional,
        versions,
        [](QuickArchive& ar, Tex& t, const char* n, bool opt) {
            return opt ? readOptionalMember(ar, t.*M, n) : readMember(ar, t.*M, n);
        },
        [](QuickArchive& ar, const Tex& t, bool opt) {
            return opt ? writeOptionalMember(ar, t.*M) : writeMember(ar, t.*M);
        },
        [](const Tex& t) { return static_cast<bool>(t.*M); },
        [](const Tex& a, const Tex& b) { return membersEqual(a.*M, b.*M); },
        [](Tex& t) { t.*M = cloneMember(t.*M); },
        [](Tex& t, std::vector<TexturePtr>& out) {
            if constexpr (std::is_same_v<Pointer, TexturePtr>) {
                if (t.*M) out.push_back(std::move(t.*M));
            } else {
                (void)t;
                (void)out;
            }
        },
    };
}

// A member without which the record cannot be written or read.
template <auto M>
constexpr auto mandatory(const char* name, record::Versions versions = record::always()) {
    return member<M>(name, false, versions);
}

// A member stored behind a presence flag.
template <auto M>
constexpr auto optional(const char* name, record::Versions versions = record::always()) {
    return member<M>(name, true, versions);
}

// One parameter of the texture's asset. A parameter that refers to a member has
// the member's child name; its child asset is written before the texture's asset.
template <class Tex>
struct Parameter {
    const char* name;
    const char* child; // nullptr for a plain value
    bool (*isSet)(const Tex& t);
    void (*writeChild)(AssetXmlWriter& writer, const Tex& t, const std::string& childUrl);
    // `url` is the child url for a member, the texture's own url otherwise.
    void (*write)(AssetXmlWriter& writer, const char* name, const Tex& t, const std::string& url);
};

// The encoding follows the field's type: "color", "acolor", "vector", "float",
// "integer", "bool".
inline void writeValue(AssetXmlWriter& w, const char* name, const Color& v) { w.writeColor(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, const AColor& v) { w.writeAColor(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, const Vector& v) { w.writeVector(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, float v) { w.writeFloat(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, std::int32_t v) { w.writeInteger(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, bool v) { w.writeBool(name, v); }
template <class T>
void writeValue(AssetXmlWriter&, const char*, const T&) = delete;

// The parameter `name` showing the plain field M.
template <auto M>
constexpr auto value(const char* name) {
    using Tex = typename MemberTraits<decltype(M)>::Class;
    return Parameter<Tex>{name, nullptr, nullptr, nullptr,
                          [](AssetXmlWriter& w, const char* n, const Tex& t, const std::string&) {
                              writeValue(w, n, t.*M);
                          }};
}

// The "plugin" parameter `name` referring to the member M, whose asset is written
// under the child name `child`.
template <auto M>
constexpr auto reference(const char* name, const char* child) {
    using Tex = typename MemberTraits<decltype(M)>::Class;
    return Parameter<Tex>{
        name,
        child,
        [](const Tex& t) { return static_cast<bool>(t.*M); },
        [](AssetXmlWriter& w, const Tex& t, const std::string& childUrl) { (t.*M)->writeXml(w, childUrl); },
        [](AssetXmlWriter& w, const char* n, const Tex& t, const std::string& childUrl) {
            w.writePlugin(n, t.*M, childUrl);
        },
    };
}

// "unknown <what> version (a, b)"; returns false.
bool refuseVersion(QuickArchive& ar, const char* what, VersionWord version);

// Opens the texture's asset, its plugin and the parameter list / closes them.
void beginAsset(AssetXmlWriter& writer, const std::string& url, const char* pluginType);
void endAsset(AssetXmlWriter& writer);

} // namespace texture

// The shared implementation of a texture kind. `Derived` provides
//   static constexpr TextureKindInfo kInfo;
//   static std::span<const texture::Member<Derived>> members();
//   static std::span<const record::Field<Derived>> fields();
//   static std::span<const texture::Parameter<Derived>> parameters();
// and declares its fields with their defaults as member initialisers. A kind that
// holds textures calls releaseTextureMembers() from its destructor.
template <class Derived>
class TextureKind : public BaseTexture {
public:
    std::int32_t kindId() const override { return Derived::kInfo.kind; }
    std::string pluginType() const override { return Derived::kInfo.pluginType; }

    void resetToDefaults() override { self() = Derived(); }

    TexturePtr clone() const override {
        Descent descent;
        if (!descent) return {};
        auto copy = boost::make_shared<Derived>(self());
        for (const auto& m : Derived::members()) m.separate(*copy);
        return copy;
    }

    bool isEqual(const TexturePtr& other) const override {
        Descent descent;
        if (!descent) return false;
        const auto* that = dynamic_cast<const Derived*>(other.get());
        if (!that) return false;
        for (const auto& m : Derived::members())
            if (!m.equal(self(), *that)) return false;
        return record::fieldsEqual(self(), *that, Derived::fields());
    }

    bool writeToArchive(QuickArchive& ar) override {
        Descent descent;
        if (!descent) return false;
        constexpr std::uint16_t version = Derived::kInfo.version;
        if (Derived::kInfo.versionBeforeCheck) ar.write(VersionWord::make(0, version));
        for (const auto& m : Derived::members())
            if (!m.optional && m.versions.holds(version) && !m.isSet(self())) return false;
        if (!Derived::kInfo.versionBeforeCheck) ar.write(VersionWord::make(0, version));
        if (Derived::kInfo.membersFirst)
            return writeMembers(ar, version) && record::writeFields(ar, self(), Derived::fields(), version);
        return record::writeFields(ar, self(), Derived::fields(), version) && writeMembers(ar, version);
    }

    // A refused version leaves the texture at its defaults.
    bool readFromArchive(QuickArchive& ar) override {
        const auto version = ar.get<VersionWord>();
        resetToDefaults();
        if (!accepts(version)) return texture::refuseVersion(ar, Derived::kInfo.what, version);
        const unsigned v = version.second();
        if (Derived::kInfo.membersFirst)
            return readMembers(ar, v) && record::readFields(ar, self(), Derived::fields(), v);
        return record::readFields(ar, self(), Derived::fields(), v) && readMembers(ar, v);
    }

    void writeXml(AssetXmlWriter& writer, std::string url) override {
        Descent descent;
        if (!descent) return;
        writeChildAssets(writer, url);
        writeOwnAsset(writer, url);
    }

protected:
    static bool accepts(VersionWord version) {
        return version.first() == 0 && version.second() >= 1 && version.second() <= Derived::kInfo.version;
    }

    bool readMembers(QuickArchive& ar, unsigned version) {
        for (const auto& m : Derived::members())
            if (m.versions.holds(version) && !m.read(ar, self(), m.name, m.optional)) return false;
        return true;
    }

    bool writeMembers(QuickArchive& ar, unsigned version) const {
        for (const auto& m : Derived::members())
            if (m.versions.holds(version) && !m.write(ar, self(), m.optional)) return false;
        return true;
    }

    // The assets of the set members, in the order of the parameters.
    void writeChildAssets(AssetXmlWriter& writer, const std::string& url) const {
        for (const auto& p : Derived::parameters())
            if (p.child && p.isSet(self())) p.writeChild(writer, self(), url + "/" + p.child);
    }

    // The texture's own asset with every parameter.
    void writeOwnAsset(AssetXmlWriter& writer, const std::string& url) const {
        texture::beginAsset(writer, url, Derived::kInfo.pluginType);
        for (const auto& p : Derived::parameters()) p.write(writer, p.name, self(), p.child ? url + "/" + p.child : url);
        texture::endAsset(writer);
    }

    void takeTextureMembers(std::vector<TexturePtr>& out) override {
        for (const auto& m : Derived::members()) m.take(self(), out);
    }

    Derived& self() { return static_cast<Derived&>(*this); }
    const Derived& self() const { return static_cast<const Derived&>(*this); }
};

} // namespace OrvexKavorCore
