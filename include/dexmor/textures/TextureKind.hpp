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
#include <dexmor/model/Kind.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>
#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <type_traits>
#include <vector>

namespace OrvexKavorCore {

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

template <auto M>
constexpr auto member(const char* name, bool optional, record::Versions versions) {
    using Tex = kind::ClassOf<M>;
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
            if constexpr (std::is_same_v<kind::TypeOf<M>, TexturePtr>) {
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

} // namespace texture

// The shared implementation of a texture kind. `Derived` provides
//   static constexpr KindInfo kInfo;
//   static std::span<const texture::Member<Derived>> members();
//   static std::span<const record::Field<Derived>> fields();
//   static std::span<const kind::ParameterRow<Derived>> parameters();
// and declares its fields with their defaults as member initialisers. A kind that
// holds textures calls releaseTextureMembers() from its destructor.
template <class Derived>
class TextureKind : public kind::Basics<Derived, BaseTexture> {
public:
    using Descent = BaseTexture::Descent;

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
        const auto version = startRead(ar);
        if (!version) return false;
        const unsigned v = *version;
        if (Derived::kInfo.membersFirst)
            return readMembers(ar, v) && record::readFields(ar, self(), Derived::fields(), v);
        return record::readFields(ar, self(), Derived::fields(), v) && readMembers(ar, v);
    }

    void writeXml(AssetXmlWriter& writer, std::string url) override {
        Descent descent;
        if (!descent) return;
        kind::writeChildAssets(writer, self(), url, Derived::parameters());
        writeOwnAsset(writer, url);
    }

protected:
    // Reads the version word and resets the texture to its defaults, then checks
    // the word: the record version, or nullopt when it is refused (the texture
    // then stays at its defaults).
    std::optional<unsigned> startRead(QuickArchive& ar) {
        const auto version = ar.get<VersionWord>();
        this->resetToDefaults();
        if (!ar.checkVersion(version, Derived::kInfo.version, Derived::kInfo.what)) return std::nullopt;
        return version.second();
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

    // The texture's own asset with every parameter.
    void writeOwnAsset(AssetXmlWriter& writer, const std::string& url) const {
        kind::beginAsset(writer, url, "texture", Derived::kInfo.pluginType);
        kind::writeParameters(writer, self(), url, Derived::parameters());
        kind::endAsset(writer);
    }

    void takeTextureMembers(std::vector<TexturePtr>& out) override {
        for (const auto& m : Derived::members()) m.take(self(), out);
    }

    Derived& self() { return static_cast<Derived&>(*this); }
    const Derived& self() const { return static_cast<const Derived&>(*this); }
};

} // namespace OrvexKavorCore
