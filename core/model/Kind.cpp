#include <dexmor/model/Kind.hpp>

namespace OrvexKavorCore::kind {

void writeValue(AssetXmlWriter& writer, const char* name, const Color& value) { writer.writeColor(name, value); }
void writeValue(AssetXmlWriter& writer, const char* name, const AColor& value) { writer.writeAColor(name, value); }
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

void beginAsset(AssetXmlWriter& writer, std::string_view url, std::string_view assetType, std::string_view pluginType,
                std::string_view layout) {
    writer.beginAsset(url, assetType, layout);
    writer.beginPlugin(pluginType, assetType);
    writer.beginParameters();
}

void endAsset(AssetXmlWriter& writer) {
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

} // namespace OrvexKavorCore::kind
