#pragma once
// What the BRDF kinds share.
//
// A BRDF kind is described by data kept beside its class:
//   - kInfo: its kind id, the record version it writes, its plugin type and its
//     name in failure reports;
//   - fields(): its record as one table that covers every version the reader
//     accepts. A row is a plain field, a texture item, a path item of the older
//     versions, the base record, or (reflection kinds) one of the two Fresnel
//     values of the older records and their conversion; each row names the
//     versions that hold it. The rows of one version, in table order, are that
//     version's record. The rows of the current version hold every field of the
//     kind exactly once.
//   - parameters(): the parameters of its XML asset in emission order. A texture
//     parameter carries the url suffix of the texture's own asset; the texture
//     parameters are at the same time the kind's list of texture fields.
// From these follow, once for all kinds:
//   record:     VersionWord (0, version), then the current version's rows. The
//               textures are stored as they are (their colours never inverted).
//   reading:    the version word, a reset to the defaults (the glass layer resets
//               only its name and flags), then the rows of the stored version.
//               Versions (0, 1) to (0, current) are accepted.
//   XML:        url = owner's url + "/" + name. The asset of every present texture
//               first, under url + "/" + its suffix; then the layer's own asset of
//               type "BRDF" with an empty layout, whose texture parameters refer to
//               the plugin inside each texture's asset (an absent texture gives a
//               parameter without value). No labels, no user data.
//   comparison: same kind, then every row of the current version: textures equal
//               by their own comparison (both absent or both present and equal),
//               colours and numbers exactly equal; the base record (name, flags)
//               is left out.
//   copy:       clone() copies every field and replaces each texture by its clone.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/brdfs/Base_BRDF.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// The fixed facts of a BRDF kind.
struct BRDFKindInfo {
    std::int32_t kind;      // the kind id under which the factory creates it
    std::uint16_t version;  // the record version written; readers accept 1 to it
    const char* pluginType; // the renderer plugin ("BRDFDiffuse"), also the default name
    const char* what;       // the kind in failure reports ("diffuse BRDF")
    // Whether a read keeps the kind's own fields: it then resets only the name and
    // the flags, and a field that the stored version lacks keeps its value.
    bool keepsFieldsOnRead = false;
};

namespace brdf {

template <class M>
struct MemberOf;
template <class C, class T>
struct MemberOf<T C::*> {
    using Class = C;
};
template <auto M>
using ClassOf = typename MemberOf<decltype(M)>::Class;

// --- record rows beyond the plain fields ---

// An optional texture item: Bool present, then the texture's Int32 kind id and its
// record. An item stored as absent empties the field (a default Fresnel texture
// included).
template <auto M>
constexpr auto textureItem(const char* name, record::Versions versions = record::always()) {
    using Obj = ClassOf<M>;
    return record::Field<Obj>{
        name,
        versions,
        [](QuickArchive& ar, Obj& o) { return readOptionalMember(ar, o.*M); },
        [](QuickArchive& ar, Obj& o) { return writeOptionalMember(ar, o.*M); },
        [](const Obj& a, const Obj& b) { return membersEqual(a.*M, b.*M); },
    };
}

// Reads a path item into `texture`: a WString naming a bitmap file. An empty path
// gives no texture, any other a bitmap texture showing that file.
bool readPathItem(QuickArchive& ar, TexturePtr& texture);

// A path item of the older records (only read: writers never write those versions).
template <auto M>
constexpr auto pathItem(const char* name, record::Versions versions) {
    using Obj = ClassOf<M>;
    return record::Field<Obj>{
        name,
        versions,
        [](QuickArchive& ar, Obj& o) { return readPathItem(ar, o.*M); },
        [](QuickArchive& ar, Obj&) {
            ar.writeWString({});
            return true;
        },
        [](const Obj& a, const Obj& b) { return membersEqual(a.*M, b.*M); },
    };
}

// The base record (name and flags) at its place in a kind's record.
template <class Obj>
constexpr record::Field<Obj> baseRecord(record::Versions versions) {
    return record::Field<Obj>{
        "base record",
        versions,
        [](QuickArchive& ar, Obj& o) { return o.readBaseRecord(ar); },
        [](QuickArchive& ar, Obj& o) { return o.writeBaseRecord(ar); },
        [](const Obj&, const Obj&) { return true; },
    };
}

// The two Fresnel values of the older reflection records, a Float32 index of
// refraction and an Int32 switch. They are not fields of the layer: they are kept
// only from their place in the record to its end, where a switch other than 0
// turns the transparency texture into a Fresnel texture of that index.
struct LegacyFresnel {
    float ior = 0.0f;
    std::int32_t on = 0;
};

// Replaces `transparencyTex` by a new Fresnel texture whose fresnel_ior is the
// legacy index, when the legacy switch is on.
void convertLegacyFresnel(const LegacyFresnel& legacy, TexturePtr& transparencyTex);

// The conversion as the last row of the versions that hold the legacy values; it
// stores nothing.
template <auto Legacy, auto Transparency>
constexpr auto fresnelConversion(record::Versions versions) {
    using Obj = ClassOf<Legacy>;
    return record::Field<Obj>{
        "Fresnel conversion",
        versions,
        [](QuickArchive&, Obj& o) {
            convertLegacyFresnel(o.*Legacy, o.*Transparency);
            return true;
        },
        [](QuickArchive&, Obj&) { return true; },
        [](const Obj&, const Obj&) { return true; },
    };
}

// --- XML parameters ---

template <class Obj>
struct Parameter {
    const char* name;
    // A texture field: a "plugin" parameter referring to the texture's asset,
    // which is written under the layer's url + "/" + urlSuffix.
    TexturePtr Obj::*texture;
    const char* urlSuffix;
    // Any other field.
    void (*write)(AssetXmlWriter& writer, const char* name, const Obj& o);
};

// The encoding follows the field's type: "color", "float", "integer".
inline void writeValue(AssetXmlWriter& w, const char* name, const Color& v) { w.writeColor(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, float v) { w.writeFloat(name, v); }
inline void writeValue(AssetXmlWriter& w, const char* name, std::int32_t v) { w.writeInteger(name, v); }
template <class T>
void writeValue(AssetXmlWriter&, const char*, const T&) = delete;

template <auto M>
constexpr auto value(const char* name) {
    using Obj = ClassOf<M>;
    return Parameter<Obj>{name, nullptr, nullptr,
                          [](AssetXmlWriter& w, const char* n, const Obj& o) { writeValue(w, n, o.*M); }};
}

// An integer field shown as a "bool": true exactly when it is not 0.
template <auto M>
constexpr auto flag(const char* name) {
    using Obj = ClassOf<M>;
    return Parameter<Obj>{name, nullptr, nullptr,
                          [](AssetXmlWriter& w, const char* n, const Obj& o) { w.writeBool(n, o.*M != 0); }};
}

template <auto M>
constexpr auto texture(const char* name, const char* urlSuffix) {
    using Obj = ClassOf<M>;
    return Parameter<Obj>{name, M, urlSuffix, nullptr};
}

// "unknown <what> version (a, b)"; returns false.
bool refuseVersion(QuickArchive& ar, const char* what, VersionWord version);

// Opens the layer's asset, its plugin and the parameter list / closes them.
void beginAsset(AssetXmlWriter& writer, const std::string& url, const char* pluginType);
void endAsset(AssetXmlWriter& writer);

} // namespace brdf

// The shared implementation of a BRDF kind. `Leaf` is the final class and gives
//   static constexpr BRDFKindInfo kInfo;
// `Shape` declares the fields (with their defaults as member initialisers) and
// gives
//   static std::span<const record::Field<Shape>> fields();
//   static std::span<const brdf::Parameter<Shape>> parameters();
// Shape is Leaf itself, except where two kinds share every field (Phong, Blinn).
template <class Leaf, class Shape = Leaf>
class BRDFKind : public Base_BRDF {
public:
    std::int32_t kindId() const override { return Leaf::kInfo.kind; }
    std::string pluginType() const override { return Leaf::kInfo.pluginType; }

    void resetToDefaults() override { leaf() = Leaf(); }

    BRDFPtr clone() const override {
        auto copy = boost::make_shared<Leaf>(leaf());
        for (const auto& p : Shape::parameters())
            if (p.texture) (*copy).*p.texture = cloneMember((*copy).*p.texture);
        return copy;
    }

    bool isEqual(const BRDFPtr& other) const override {
        const auto* that = dynamic_cast<const Leaf*>(other.get());
        if (!that) return false;
        for (const auto& f : Shape::fields())
            if (f.versions.holds(Leaf::kInfo.version) && !f.equal(shape(), *that)) return false;
        return true;
    }

    // A failing texture write fails the record at once.
    bool writeToArchive(QuickArchive& ar) override {
        constexpr std::uint16_t version = Leaf::kInfo.version;
        ar.write(VersionWord::make(0, version));
        return record::writeFields(ar, shape(), Shape::fields(), version);
    }

    bool readFromArchive(QuickArchive& ar) override {
        const auto version = ar.get<VersionWord>();
        if constexpr (Leaf::kInfo.keepsFieldsOnRead)
            resetBase();
        else
            resetToDefaults();
        if (version.first() != 0 || version.second() < 1 || version.second() > Leaf::kInfo.version)
            return brdf::refuseVersion(ar, Leaf::kInfo.what, version);
        return record::readFields(ar, shape(), Shape::fields(), version.second());
    }

    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override {
        const std::string url = urlPrefix + "/" + name;
        const Shape& s = shape();
        for (const auto& p : Shape::parameters())
            if (p.texture && s.*p.texture) (s.*p.texture)->writeXml(writer, url + "/" + p.urlSuffix);
        brdf::beginAsset(writer, url, Leaf::kInfo.pluginType);
        for (const auto& p : Shape::parameters()) {
            if (p.texture)
                writer.writePlugin(p.name, s.*p.texture, url + "/" + p.urlSuffix);
            else
                p.write(writer, p.name, s);
        }
        brdf::endAsset(writer);
    }

protected:
    BRDFKind() { name = Leaf::kInfo.pluginType; }
    BRDFKind(const BRDFKind&) = default;
    BRDFKind& operator=(const BRDFKind&) = default;

private:
    Leaf& leaf() { return static_cast<Leaf&>(*this); }
    const Leaf& leaf() const { return static_cast<const Leaf&>(*this); }
    Shape& shape() { return static_cast<Shape&>(*this); }
    const Shape& shape() const { return static_cast<const Shape&>(*this); }
};

} // namespace OrvexKavorCore
