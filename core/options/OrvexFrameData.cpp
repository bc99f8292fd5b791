#include <dexmor/options/OrvexFrameData.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/RecordEncodings.hpp"
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using F = KavorUtils::KavorFrameData;

#define ROW(name, encoding) record::fieldAs<record::enc::encoding, &F::name>(#name)

// The frame data's record, in archive order after its VersionWord(0, 1).
constexpr std::array kFields{
    ROW(t, Float64),                     // 1
    ROW(frameStart, Float64),            // 2
    ROW(frameEnd, Float64),              // 3
    ROW(currentFrame, Int32),            // 4
    ROW(worldToCam, Transform),          // 5
    ROW(camToWorld, Transform),          // 6
    ROW(fov, Float32),                   // 7
    ROW(nearRange, Float32),             // 8
    ROW(farRange, Float32),              // 9
    ROW(focal_dist, Float32),            // 10
    ROW(aperture, Float32),              // 11
    ROW(rotation, Float32),              // 12
    ROW(clippingPlanes, Int32),          // 13
    ROW(clipNear, Float32),              // 14
    ROW(clipFar, Float32),               // 15
    ROW(projType, Int32),                // 16
    ROW(zoomFractor, Float32),           // 17
    ROW(infiniteProj, Int32),            // 18
    ROW(height, Float32),                // 19
    ROW(auto_fit, Int32),                // 20
    ROW(dist, Float32),                  // 21
    ROW(curve, Float32),                 // 22
    ROW(orthoAdjustToScene, Int32),      // 23
    ROW(ambient, Color),                 // 24
    ROW(background, Color),              // 25
    ROW(globalLightLevel, Color),        // 26
    ROW(kavorGIBackground, Color),       // 27
    ROW(kavorRRBackground, Color),       // 28
    ROW(kavorRefractBackground, Color),  // 29
    ROW(rgn_left, Float32),              // 30
    ROW(rgn_width, Float32),             // 31
    ROW(rgn_top, Float32),               // 32
    ROW(rgn_height, Float32),            // 33
    ROW(fd_aux1, Int32),                 // 34
    ROW(fd_aux2, Int32),                 // 35
    ROW(bmp_width, Int32),               // 36
    ROW(bmp_height, Int32),              // 37
    ROW(r_left, Int32),                  // 38
    ROW(r_width, Int32),                 // 39
    ROW(r_top, Int32),                   // 40
    ROW(r_height, Int32),                // 41
    ROW(devAspect, Float32),             // 42
    ROW(fieldMask, Int32),               // 43
    ROW(fieldOrder, Int32),              // 44
    ROW(firstField, Int32),              // 45
    ROW(dark_mult, Float32),             // 46
    ROW(bright_mult, Float32),           // 47
};

#undef ROW

static_assert(kFields.size() == 47);

} // namespace

bool OrvexFrameData::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    return record::writeFields(ar, static_cast<F&>(*this), kFields, kVersion);
}

bool OrvexFrameData::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (!version.is(0, kVersion))
        return ar.fail("unknown frame data version (" + std::to_string(version.first()) + ", " +
                       std::to_string(version.second()) + ")");
    return record::readFields(ar, static_cast<F&>(*this), kFields, kVersion);
}

void OrvexFrameData::resetToDefaults() { static_cast<F&>(*this) = F{}; }

void OrvexFrameData::writeXml(AssetXmlWriter& writer, std::string path) {
    writer.beginAsset(path + "/" + pluginType(), assetType(), "");
    writer.beginPlugin(pluginType(), assetType());
    writer.beginParameters();
    writer.writeFloat("t", static_cast<float>(t));
    writer.writeFloat("frameStart", static_cast<float>(frameStart));
    writer.writeFloat("frameEnd", static_cast<float>(frameEnd));
    writer.writeInteger("currentFrame", currentFrame);
    writer.writeTransform("worldToCam", worldToCam);
    writer.writeTransform("camToWorld", camToWorld);
    writer.writeFloat("fov", fov);
    writer.writeFloat("nearRange", nearRange);
    writer.writeFloat("farRange", farRange);
    writer.writeInteger("clippingPlanes", clippingPlanes);
    writer.writeFloat("clipNear", clipNear);
    writer.writeFloat("clipFar", clipFar);
    writer.writeInteger("projType", projType);
    writer.writeFloat("zoomFractor", zoomFractor);
    writer.writeInteger("infiniteProj", infiniteProj);
    writer.writeInteger("orthoAdjustToScene", orthoAdjustToScene);
    writer.writeColor("ambient", ambient);
    writer.writeColor("background", background);
    writer.writeColor("globalLightLevel", globalLightLevel);
    writer.writeColor("kavorGIBackground", kavorGIBackground);
    writer.writeColor("kavorRRBackground", kavorRRBackground);
    writer.writeColor("kavorRefractBackground", kavorRefractBackground);
    writer.writeFloat("devAspect", devAspect);
    writer.writeInteger("fieldMask", fieldMask);
    writer.writeInteger("fieldOrder", fieldOrder);
    writer.writeInteger("firstField", firstField);
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

bool OrvexFrameData::isEqual(const OrvexFrameData& other) const {
    return record::fieldsEqual<F>(*this, other, kFields);
}

const char* OrvexFrameData::firstDifference(const OrvexFrameData& other) const {
    return record::firstDifference<F>(*this, other, kFields);
}

std::span<const record::Field<KavorUtils::KavorFrameData>> OrvexFrameData::recordFields() { return kFields; }

} // namespace OrvexKavorCore
