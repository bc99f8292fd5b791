#include <dexmor/lights/LightKind.hpp>

#include <dexmor/xml/AssetXmlWriter.hpp>

namespace OrvexKavorCore {

namespace lightxml {

void writeValue(AssetXmlWriter& writer, const char* name, const Color& value) { writer.writeColor(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, const Vector& value) { writer.writeVector(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, const Transform& value) {
    writer.writeTransform(name, value);
}
void writeValue(AssetXmlWriter& writer, const char* name, float value) { writer.writeFloat(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, std::int32_t value) { writer.writeInteger(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, std::uint32_t value) {
    writer.writeInteger(name, static_cast<std::int32_t>(value));
}
void writeValue(AssetXmlWriter& writer, const char* name, bool value) { writer.writeBool(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, const std::string& value) {
    writer.writeString(name, value);
}

void beginAsset(AssetXmlWriter& writer, const std::string& url, const std::string& pluginType) {
    writer.beginAsset(url, "light", "");
    writer.beginPlugin(pluginType, "light");
    writer.beginParameters();
}

void endAsset(AssetXmlWriter& writer) {
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

} // namespace lightxml

bool refuseLightVersion(QuickArchive& ar, const char* what, VersionWord version) {
    return ar.fail(std::string("unknown ") + what + " version (" + std::to_string(version.first()) + ", " +
                   std::to_string(version.second()) + ")");
}

} // namespace OrvexKavorCore
