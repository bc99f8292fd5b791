#pragma once
// SkyTexture: the sky of a sun. Its stored numbers repeat the sun light's
// parameter set; only the sun reaches the XML.
//
// Record, version 3 (after the VersionWord (0, 3)):
//   Bool      sun present (the sun is set and is a sun light)
//             when present: the sun light's own record (no kind id in front)
//   Vector    up_vector
//   Float32   shadowBias, turbidity, water_vapour, intensity_multiplier,
//             size_multiplier, photon_radius, photon_emit_distance, ozone
//   Int32     photonSubdivs, causticSubdivs, shadow_subdivs
//   Bool      flag1, flag2
//   WString   identifier
//             the transform's record
//             the record of the shared default sun
//   Bool      is-default: the sun carries the shared default sun's identifier
// Version 2 holds the sun part, the transform as a plain Transform (its value at
// time 0), then up_vector .. identifier. Version 1 holds the sun part only.
//
// A failed read of the sky's own sun is ignored (the record goes on after it).
//
// The shared default sun: one sun light named "Default" with a fixed identifier.
// Every reset sky points at it; reading a version-3 record overwrites it with the
// stored copy, and a stored is-default flag points the sky at it. It belongs to
// the current conversion (see PerConversion): each conversion's context starts
// from a fresh pristine one, so that one file's default sun never reaches the
// conversion of the next.
#include <dexmor/lights/SunLight.hpp>
#include <dexmor/model/PerConversion.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/textures/TextureKind.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// The name and identifier of the shared default sun.
inline constexpr const char* kDefaultSunName = "Default";
inline constexpr const char* kDefaultSunIdentifier = "{D3BE9766-E4AA-418b-81A9-23414A2BA98D}";

// The default sun of a conversion, pristine until a sky record writes into it.
struct DefaultSun {
    boost::shared_ptr<SunLight> light = pristine();
    // How many sky records have written into it: a conversion that must know
    // whether it changed compares its content only when this moved.
    unsigned long writes = 0;
    static boost::shared_ptr<SunLight> pristine();
};
// The current conversion's default sun.
boost::shared_ptr<SunLight> sharedDefaultSun();

class SkyTexture final : public TextureKind<SkyTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kSky, .version = 3, .pluginType = "TexSky", .what = "sky texture"};

    LightPtr sun = sharedDefaultSun();
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
    bool flag1 = true;
    bool flag2 = false;
    // Lower-case UUID text, new for every reset and every clone; compared
    // ignoring the case of ASCII letters.
    std::string identifier = newUuidText();

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
    // The copy receives a new identifier, so it never equals its original.
    TexturePtr clone() const override;
    // The sun's asset first (once per document), then the sky's asset whose "sun"
    // parameter holds the url the document gave that sun.
    void writeXml(AssetXmlWriter& writer, std::string url) override;

    // The sun as a sun light, or nullptr when it is absent or another light.
    SunLight* sunLight() const;

    static std::span<const texture::Member<SkyTexture>> members();
    static std::span<const record::Field<SkyTexture>> fields();
    static std::span<const kind::ParameterRow<SkyTexture>> parameters();
};

} // namespace OrvexKavorCore
