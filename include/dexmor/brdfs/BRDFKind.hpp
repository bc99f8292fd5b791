#pragma once
// What the BRDF kinds share.
//
// A BRDF kind is described by data kept beside its class:
//   - kInfo (a KindInfo): its kind id, the record version it writes, its plugin
//     type (also its default name), its name in failure reports, and whether a
//     read keeps its fields;
//   - fields(): its record as one table that covers every version the reader
//     accepts. A row is a plain field, a texture item (an optional member: Bool
//     present, then the texture's Int32 kind id and its record; an item stored
//     as absent empties the field, a default Fresnel texture included), a path
//     item of the older versions, the base record, or (reflection kinds) one of
//     the two Fresnel values of the older records and their conversion; each row
//     names the versions that hold it. The rows of one version, in table order, are that
//     version's record. The rows of the current version hold every field of the
//     kind exactly once.
//   - parameters(): the parameters of its XML asset in emission order. A texture
//     parameter (kind::reference) carries the child name of the texture's own
//     asset; the texture parameters are at the same time the kind's list of
//     texture fields.
// From these follow, once for all kinds:
//   record:     VersionWord (0, version), then the current version's rows. The
//               textures are stored as they are (their colours never inverted).
//   reading:    the version word, a reset to the defaults (the glass layer resets
//               only its name and flags), then the rows of the stored version.
//               Versions (0, 1) to (0, current) are accepted.
//   XML:        url = owner's url + "/" + name. The asset of every present texture
//               first, under url + "/" + its child name; then the layer's own
//               asset of type "BRDF" with an empty layout, whose texture
//               parameters refer to the plugin inside each texture's asset (an
//               absent texture gives a parameter without value). No labels, no user data.
//   comparison: same kind, then every row of the current version: textures equal
//               by their own comparison (both absent or both present and equal),
//               colours and numbers exactly equal; the base record (name, flags)
//               is left out.
//   copy:       clone() copies every field and replaces each texture by its clone.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/brdfs/Base_BRDF.hpp>
#include <dexmor/model/Kind.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

namespace brdf {

using kind::ClassOf;

// --- record rows beyond the plain fields ---

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

} // namespace brdf

// The shared implementation of a BRDF kind. `Leaf` is the final class and gives
//   static constexpr KindInfo kInfo;
// `Shape` declares the fields (with their defaults as member initialisers) and
// gives
//   static std::span<const record::Field<Shape>> fields();
//   static std::span<const kind::ParameterRow<Shape>> parameters();
// Shape is Leaf itself, except where two kinds share every field (Phong, Blinn).
template <class Leaf, class Shape = Leaf>
class BRDFKind : public kind::Basics<Leaf, Base_BRDF> {
public:
    BRDFPtr clone() const override {
        auto copy = boost::make_shared<Leaf>(leaf());
        kind::copyChildren(static_cast<Shape&>(*copy), Shape::parameters());
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
        // A refused version leaves the layer reset.
        if constexpr (Leaf::kInfo.keepsFieldsOnRead)
            this->resetBase();
        else
            this->resetToDefaults();
        if (!ar.checkVersion(version, Leaf::kInfo.version, Leaf::kInfo.what)) return false;
        return record::readFields(ar, shape(), Shape::fields(), version.second());
    }

    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override {
        const std::string url = urlPrefix + "/" + this->name;
        kind::writeChildAssets(writer, shape(), url, Shape::parameters());
        kind::beginAsset(writer, url, "BRDF", Leaf::kInfo.pluginType);
        kind::writeParameters(writer, shape(), url, Shape::parameters());
        kind::endAsset(writer);
    }

protected:
    BRDFKind() { this->name = Leaf::kInfo.pluginType; }
    BRDFKind(const BRDFKind&) = default;
    BRDFKind& operator=(const BRDFKind&) = default;

private:
    Leaf& leaf() { return static_cast<Leaf&>(*this); }
    const Leaf& leaf() const { return static_cast<const Leaf&>(*this); }
    Shape& shape() { return static_cast<Shape&>(*this); }
    const Shape& shape() const { return static_cast<const Shape&>(*this); }
};

} // namespace OrvexKavorCore
