#include <dexmor/options/OrvexFrameData.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/RecordEncodings.hpp"
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using F = KavorUtils::KavorFrameData;

namespace enc = record::enc;

// The frame data's record, in archive order after its VersionWord(0, 1).
constexpr std::array kFields{
    record::fieldAs<enc::Float64, &F::t>("t"),                     // 1
    record::fieldAs<enc::Float64, &F::frameStart>("frameStart"),            // 2
    record::fieldAs<enc::Float64, &F::frameEnd>("frameEnd"),              // 3
    record::fieldAs<enc::Int32, &F::currentFrame>("currentFrame"),            // 4
    record::fieldAs<enc::Transform, &F::worldToCam>("worldToCam"),          // 5
    record::fieldAs<enc::Transform, &F::camToWorld>("camToWorld"),          // 6
    record::fieldAs<enc::Float32, &F::fov>("fov"),                   // 7
    record::fieldAs<enc::Float32, &F::nearRange>("nearRange"),             // 8
    record::fieldAs<enc::Float32, &F::farRange>("farRange"),              // 9
    record::fieldAs<enc::Float32, &F::focal_dist>("focal_dist"),            // 10
    record::fieldAs<enc::Float32, &F::aperture>("aperture"),              // 11
    record::fieldAs<enc::Float32, &F::rotation>("rotation"),              // 12
    record::fieldAs<enc::Int32, &F::clippingPlanes>("clippingPlanes"),          // 13
    record::fieldAs<enc::Float32, &F::clipNear>("clipNear"),              // 14
    record::fieldAs<enc::Float32, &F::clipFar>("clipFar"),               // 15
    record::fieldAs<enc::Int32, &F::projType>("projType"),                // 16
    record::fieldAs<enc::Float32, &F::zoomFractor>("zoomFractor"),           // 17
    record::fieldAs<enc::Int32, &F::infiniteProj>("infiniteProj"),            // 18
    record::fieldAs<enc::Float32, &F::height>("height"),                // 19
    record::fieldAs<enc::Int32, &F::auto_fit>("auto_fit"),                // 20
    record::fieldAs<enc::Float32, &F::dist>("dist"),                  // 21
    record::fieldAs<enc::Float32, &F::curve>("curve"),                 // 22
    record::fieldAs<enc::Int32, &F::orthoAdjustToScene>("orthoAdjustToScene"),      // 23
    record::fieldAs<enc::Color, &F::ambient>("ambient"),                 // 24
    record::fieldAs<enc::Color, &F::background>("background"),              // 25
    record::fieldAs<enc::Color, &F::globalLightLevel>("globalLightLevel"),        // 26
    record::fieldAs<enc::Color, &F::kavorGIBackground>("kavorGIBackground"),       // 27
    record::fieldAs<enc::Color, &F::kavorRRBackground>("kavorRRBackground"),       // 28
    record::fieldAs<enc::Color, &F::kavorRefractBackground>("kavorRefractBackground"),  // 29
    record::fieldAs<enc::Float32, &F::rgn_left>("rgn_left"),              // 30
    record::fieldAs<enc::Float32, &F::rgn_width>("rgn_width"),             // 31
    record::fieldAs<enc::Float32, &F::rgn_top>("rgn_top"),               // 32
    record::fieldAs<enc::Float32, &F::rgn_height>("rgn_height"),            // 33
    record::fieldAs<enc::Int32, &F::fd_aux1>("fd_aux1"),                 // 34
    record::fieldAs<enc::Int32, &F::fd_aux2>("fd_aux2"),                 // 35
    record::fieldAs<enc::Int32, &F::bmp_width>("bmp_width"),               // 36
    record::fieldAs<enc::Int32, &F::bmp_height>("bmp_height"),              // 37
    record::fieldAs<enc::Int32, &F::r_left>("r_left"),                  // 38
    record::fieldAs<enc::Int32, &F::r_width>("r_width"),                 // 39
    record::fieldAs<enc::Int32, &F::r_top>("r_top"),                   // 40
    record::fieldAs<enc::Int32, &F::r_height>("r_height"),                // 41
    record::fieldAs<enc::Float32, &F::devAspect>("devAspect"),             // 42
    record::fieldAs<enc::Int32, &F::fieldMask>("fieldMask"),               // 43
    record::fieldAs<enc::Int32, &F::fieldOrder>("fieldOrder"),              // 44
    record::fieldAs<enc::Int32, &F::firstField>("firstField"),              // 45
    record::fieldAs<enc::Float32, &F::dark_mult>("dark_mult"),             // 46
    record::fieldAs<enc::Float32, &F::bright_mult>("bright_mult"),           // 47
};


static_assert(kFields.size() == 47);

} // namespace

bool OrvexFrameData::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    return record::writeFields(ar, static_cast<F&>(*this), kFields, kVersion);
}

bool OrvexFrameData::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    static_assert(kVersion == 1, "frame data records have one version");
    if (!ar.readVersion(kVersion, "frame data")) return false;
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
