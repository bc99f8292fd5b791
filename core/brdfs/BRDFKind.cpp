#include <dexmor/brdfs/BRDFKind.hpp>

#include <dexmor/textures/ColorTextures.hpp>
#include <dexmor/textures/TextureFunctions.hpp>

namespace OrvexKavorCore::brdf {

bool readPathItem(QuickArchive& ar, TexturePtr& texture) {
    std::string path;
    if (!ar.readWString(path)) return false;
    texture = makeBitmapTexture(path);
    return true;
}

void convertLegacyFresnel(const LegacyFresnel& legacy, TexturePtr& transparencyTex) {
    if (legacy.on == 0) return;
    auto fresnel = boost::make_shared<FresnelTexture>();
    fresnel->fresnel_ior = legacy.ior;
    transparencyTex = fresnel;
}

bool refuseVersion(QuickArchive& ar, const char* what, VersionWord version) {
    return ar.fail(std::string("unknown ") + what + " version (" + std::to_string(version.first()) + ", " +
                   std::to_string(version.second()) + ")");
}

void beginAsset(AssetXmlWriter& writer, const std::string& url, const char* pluginType) {
    writer.beginAsset(url, "BRDF", "");
    writer.beginPlugin(pluginType, "BRDF");
    writer.beginParameters();
}

void endAsset(AssetXmlWriter& writer) {
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

} // namespace OrvexKavorCore::brdf
