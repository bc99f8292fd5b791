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

} // namespace OrvexKavorCore::brdf
