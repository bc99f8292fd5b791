#pragma once
// The sun light: the optional sun of a sky texture.
//
// Record, version 4 (after the VersionWord (0, 4)):
//   Vector up_vector; Float32 shadowBias, turbidity, water_vapour,
//   intensity_multiplier, size_multiplier, photon_radius, photon_emit_distance,
//   ozone; Int32 photonSubdivs, causticSubdivs, shadow_subdivs; Bool shadows;
//   WString identifier, name; Bool enabled, invisible; the placement's own record.
// Versions 1 to 3 begin with the placement as a plain Transform (its value at
// time 0) and end after shadows (1), name (2) or invisible (3).
//
// A sun is identified by its `identifier`: one document holds one asset per
// identifier, named by the order in which the suns are written (see writeXml).
#include <dexmor/lights/LightKind.hpp>
#include <dexmor/model/PerConversion.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/platform/Uuid.hpp>

#include <cstdint>
#include <map>
#include <span>
#include <string>

namespace OrvexKavorCore {

class SunLight final : public LightKind<SunLight> {
public:
    static constexpr KindInfo kInfo{kSun, 4, "SunLight", "sun light"};
    static std::span<const record::Field<SunLight>> recordFields();
    static std::span<const kind::ParameterRow<SunLight>> xmlParameters();

    // The defaults, with a newly generated identifier.
    SunLight() = default;
    // The defaults, with the given name and identifier.
    SunLight(std::string sunName, std::string sunIdentifier);

    // Writes the sun's asset once per document. The url does not derive from
    // `path`: the first sun of a document is "/SunLight", the next ones
    // "/SunLight1", "/SunLight2", ... in writing order. The document's sun urls
    // keep identifier -> url; a sun whose identifier is already there writes
    // nothing (owners refer to it through the url kept there).
    void writeXml(AssetXmlWriter& writer, std::string path) override;

    AnimatedTransform transform; // the identity at time 0
    Vector up_vector{0.0f, 0.0f, 1.0f};
    float shadowBias = 0.0f;
    float turbidity = 3.0f;
    float water_vapour = 2.0f;
    float intensity_multiplier = 1.0f;
    float size_multiplier = 1.0f;
    float photon_radius = 50.0f;
    float photon_emit_distance = 150.0f;
    float ozone = 0.35f;
    std::int32_t photonSubdivs = 500;
    std::int32_t causticSubdivs = 1000;
    std::int32_t shadow_subdivs = 8;
    bool shadows = true;
    bool enabled = true;
    bool invisible = false;
    std::string identifier = newUuidText();
    std::string name; // carried through the record only
};

// The sun light assets written in the current document, one set per conversion
// (see PerConversion): identifier -> url.
struct DocumentSunUrls {
    std::map<std::string, std::string> urls;

    // The url of the sun asset this document wrote for `identifier`, or empty.
    static std::string urlOf(const std::string& identifier);
};

} // namespace OrvexKavorCore
