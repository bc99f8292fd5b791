#include <dexmor/textures/UVWGenerators.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/model/Kind.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

constexpr std::array<std::string_view, 4> kMappingNames = {"angular", "cubic", "spherical", "mirror_ball"};

// Reads a components record, labelled for failure reports.
bool readComponents(QuickArchive& ar, TransformComponents& components, const char* name) {
    auto scope = QuickArchive::Scope::label(ar, name);
    return components.readFromArchive(ar);
}

} // namespace

std::string_view environmentMappingName(std::int32_t mappingType) {
    if (mappingType < 0 || static_cast<std::size_t>(mappingType) >= kMappingNames.size()) return {};
    return kMappingNames[static_cast<std::size_t>(mappingType)];
}

// --- planar world and object ---

bool GenProjectionUVW::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, 1));
    ar.write(uvwTransform);
    return uvwComponents.writeToArchive(ar);
}

bool GenProjectionUVW::readFromArchive(QuickArchive& ar) {
    if (!ar.readVersion(1, "projection UVW generator")) return false;
    ar.readAs("uvw_transform", uvwTransform);
    return readComponents(ar, uvwComponents, "uvwComponents");
}

void GenProjectionUVW::updateTransforms() { uvwTransform = uvwComponents.buildTransform(); }

void GenProjectionUVW::writeXml(AssetXmlWriter& writer, std::string url) {
    updateTransforms();
    kind::beginAsset(writer, url, assetType(), pluginType());
    writeComponentTransform(writer, "uvw_transform", uvwComponents);
    kind::endAsset(writer);
}

bool GenProjectionUVW::sameFields(const GenProjectionUVW& other) const {
    return uvwTransform == other.uvwTransform && uvwComponents == other.uvwComponents;
}

UVWPtr GenPlanarWorldUVW::clone() const { return boost::make_shared<GenPlanarWorldUVW>(*this); }

bool GenPlanarWorldUVW::isEqual(const UVWPtr& other) const {
    const auto* o = dynamic_cast<const GenPlanarWorldUVW*>(other.get());
    return o && sameFields(*o);
}

bool GenObjectUVW::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    return GenProjectionUVW::readFromArchive(ar);
}

UVWPtr GenObjectUVW::clone() const { return boost::make_shared<GenObjectUVW>(*this); }

bool GenObjectUVW::isEqual(const UVWPtr& other) const {
    const auto* o = dynamic_cast<const GenObjectUVW*>(other.get());
    return o && sameFields(*o);
}

// --- environment ---

bool GenEnvironmentUVW::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, 2));
    ar.write(uvwMatrix);
    ar.write(mappingType);
    return uvwComponents.writeToArchive(ar);
}

// Version 1 stored only two rotations and two mirror flags instead of the whole
// components record:
//   Matrix uvwMatrix; Int32 mappingType;
//   Float32 z_rotation; Float32 x_rotation; Int32 z_mirror; Int32 x_mirror
// The other components keep their values.
bool GenEnvironmentUVW::readFromArchive(QuickArchive& ar) {
    const auto version = ar.readVersion(2, "environment UVW generator");
    if (!version) return false;
    ar.readAs("uvw_matrix", uvwMatrix);
    ar.readAs("mapping_type", mappingType);
    if (version->second() == 2) return readComponents(ar, uvwComponents, "uvwComponents");
    ar.readAs("z_rotation", uvwComponents.z_rotation);
    ar.readAs("x_rotation", uvwComponents.x_rotation);
    ar.readAs("z_mirror", uvwComponents.z_mirror);
    ar.readAs("x_mirror", uvwComponents.x_mirror);
    return true;
}

void GenEnvironmentUVW::updateTransforms() { uvwMatrix = uvwComponents.buildMatrix(); }

UVWPtr GenEnvironmentUVW::clone() const { return boost::make_shared<GenEnvironmentUVW>(*this); }

bool GenEnvironmentUVW::isEqual(const UVWPtr& other) const {
    const auto* o = dynamic_cast<const GenEnvironmentUVW*>(other.get());
    return o && mappingType == o->mappingType && uvwMatrix == o->uvwMatrix && uvwComponents == o->uvwComponents;
}

void GenEnvironmentUVW::writeXml(AssetXmlWriter& writer, std::string url) {
    updateTransforms();
    kind::beginAsset(writer, url, assetType(), pluginType());
    writeComponentMatrix(writer, "uvw_matrix", uvwComponents);
    writer.writeString("mapping_type", environmentMappingName(mappingType));
    kind::endAsset(writer);
}

// --- channel ---

bool GenChannelUVW::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, 2));
    ar.write(uvwTransform);
    ar.write(texTransform);
    ar.write(wrap_u);
    ar.write(wrap_v);
    ar.write(uvw_channel);
    return uvwComponents.writeToArchive(ar) && texComponents.writeToArchive(ar);
}

// Version 1 stored the two transforms, then only two rotations and two mirror
// flags of the texture components, then the integers:
//   Transform uvwTransform; Transform texTransform;
//   Float32 tex x_rotation; Float32 tex y_rotation; Int32 tex x_mirror; Int32 tex y_mirror;
//   Int32 wrap_u, wrap_v, uvw_channel
// The other components, and all of uvwComponents, keep their values.
bool GenChannelUVW::readFromArchive(QuickArchive& ar) {
    const auto version = ar.readVersion(2, "channel UVW generator");
    if (!version) return false;
    ar.readAs("uvw_transform", uvwTransform);
    ar.readAs("tex_transform", texTransform);
    if (version->second() == 1) {
        ar.readAs("x_rotation", texComponents.x_rotation);
        ar.readAs("y_rotation", texComponents.y_rotation);
        ar.readAs("x_mirror", texComponents.x_mirror);
        ar.readAs("y_mirror", texComponents.y_mirror);
    }
    ar.readAs("wrap_u", wrap_u);
    ar.readAs("wrap_v", wrap_v);
    ar.readAs("uvw_channel", uvw_channel);
    if (version->second() == 1) return true;
    return readComponents(ar, uvwComponents, "uvwComponents") && readComponents(ar, texComponents, "texComponents");
}

void GenChannelUVW::updateTransforms() {
    uvwTransform = uvwComponents.buildTransform();
    texTransform = texComponents.buildTransform();
}

UVWPtr GenChannelUVW::clone() const { return boost::make_shared<GenChannelUVW>(*this); }

bool GenChannelUVW::isEqual(const UVWPtr& other) const {
    const auto* o = dynamic_cast<const GenChannelUVW*>(other.get());
    return o && uvwTransform == o->uvwTransform && texTransform == o->texTransform &&
           uvwComponents == o->uvwComponents && texComponents == o->texComponents && wrap_u == o->wrap_u &&
           wrap_v == o->wrap_v && uvw_channel == o->uvw_channel;
}

void GenChannelUVW::writeXml(AssetXmlWriter& writer, std::string url) {
    updateTransforms();
    kind::beginAsset(writer, url, assetType(), pluginType());
    writeComponentTransform(writer, "uvw_transform", uvwComponents);
    writer.writeTransform("tex_transform", texTransform);
    writer.writeInteger("wrap_u", wrap_u);
    writer.writeInteger("wrap_v", wrap_v);
    writer.writeInteger("uvw_channel", uvw_channel);
    kind::endAsset(writer);
}

} // namespace OrvexKavorCore
