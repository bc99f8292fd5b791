#pragma once
// OrvexFrameData: the per-frame camera and view data of the options set (time
// range, view transforms, field of view, clipping, projection, render region,
// bitmap size, background colours, depth of field and colour-mapping values),
// stored with a record version of its own. The options set shows some of its
// fields in its settings sections; the block can also write itself as an asset.
#include <dexmor/archive/Record.hpp>
#include <dexmor/options/OrvexOptionsBase.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace KavorUtils {

// The renderer's frame record. The member initialisers are the defaults.
struct KavorFrameData {
    double t = 0.0;
    double frameStart = 0.0;
    double frameEnd = 1.0;
    std::int32_t currentFrame = 0;
    Transform worldToCam = Transform::zero();
    Transform camToWorld = Transform::zero();
    float fov = 0.0f;
    float nearRange = 0.0f;
    float farRange = 0.0f;
    float focal_dist = 200.0f;
    float aperture = 0.1f;
    float rotation = 0.0f;
    std::int32_t clippingPlanes = 0;
    float clipNear = 0.0f;
    float clipFar = 0.0f;
    std::int32_t projType = 0;
    float zoomFractor = 1.0f;
    std::int32_t infiniteProj = 0;
    float height = 400.0f;
    std::int32_t auto_fit = 1;
    float dist = 2.0f;
    float curve = 1.0f;
    std::int32_t orthoAdjustToScene = 0;
    Color ambient;
    Color background;
    Color globalLightLevel;
    Color kavorGIBackground;
    Color kavorRRBackground;
    Color kavorRefractBackground;
    float rgn_left = 0.0f;
    float rgn_width = 0.0f;
    float rgn_top = 0.0f;
    float rgn_height = 0.0f;
    std::int32_t fd_aux1 = 0;
    std::int32_t fd_aux2 = 0;
    std::int32_t bmp_width = 0;
    std::int32_t bmp_height = 0;
    std::int32_t r_left = 0;
    std::int32_t r_width = 0;
    std::int32_t r_top = 0;
    std::int32_t r_height = 0;
    float devAspect = 1.0f;
    std::int32_t fieldMask = 3;
    std::int32_t fieldOrder = 0;
    std::int32_t firstField = 0;
    float dark_mult = 1.0f;
    float bright_mult = 1.0f;
};

} // namespace KavorUtils

namespace OrvexKavorCore {

class OrvexFrameData : public OrvexOptionsBase, public KavorUtils::KavorFrameData {
public:
    static constexpr std::uint16_t kVersion = 1;

    // VersionWord(0, 1), then the 47 fields in declaration order.
    bool writeToArchive(QuickArchive& ar) override;
    // Resets, then reads a record of version (0, 1); any other version word fails.
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override;

    // The asset `path`/FrameData: a "FrameData" settings plugin with the time range,
    // view transforms, projection and background colours (the fields the options
    // set's sections do not show). Not enclosed in an "Assets" element.
    void writeXml(AssetXmlWriter& writer, std::string path) override;
    std::string pluginType() const override { return "FrameData"; }
    std::string assetType() const override { return "settings"; }

    // Every field equal (exact float comparison).
    bool isEqual(const OrvexFrameData& other) const;
    // The name of the first field that differs, or nullptr.
    const char* firstDifference(const OrvexFrameData& other) const;

    static std::span<const record::Field<KavorUtils::KavorFrameData>> recordFields();
};

} // namespace OrvexKavorCore
