#include <dexmor/textures/TextureKind.hpp>

namespace OrvexKavorCore::texture {

bool refuseVersion(QuickArchive& ar, const char* what, VersionWord version) {
    return ar.fail(std::string("unknown ") + what + " version (" + std::to_string(version.first()) + ", " +
                   std::to_string(version.second()) + ")");
}

void beginAsset(AssetXmlWriter& writer, const std::string& url, const char* pluginType) {
    writer.beginAsset(url, "texture", "");
    writer.beginPlugin(pluginType, "texture");
    writer.beginParameters();
}

void endAsset(AssetXmlWriter& writer) {
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

} // namespace OrvexKavorCore::texture
