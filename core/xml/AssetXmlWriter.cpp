#include "xml/AssetXmlWriter.hpp"

#include "lights/BaseLight.hpp"
#include "materials/BaseMaterial.hpp"
#include "options/BaseCamera.hpp"
#include "params/TransformComponents.hpp"
#include "platform/Text.hpp"
#include "textures/BaseBitmap.hpp"
#include "textures/BaseTexture.hpp"
#include "textures/BaseUVW.hpp"
#include "xml/NumberFormat.hpp"

#include <charconv>
#include <cstring>
#include <stdexcept>

namespace OrvexKavorCore {

namespace {

// Which characters an escaping replaces: all five of XML's predefined entities
// (attribute values and entries), or only & < > (element text that keeps its
// quotes and apostrophes as they are).
enum class Escape { kAll, kMarkup };

// Appends `text` with the characters that need it replaced by entities. Runs of
// other characters are copied in one piece, as they are (UTF-8 text) or widened
// byte for byte (narrow text). Every replaced character is ASCII, so escaping a
// narrow text before widening it is the same as escaping after.
template <Escape kind, bool narrow>
void appendWithEntities(std::string& out, std::string_view text) {
    const auto copy = [&out](std::string_view run) {
        if constexpr (narrow)
            text::appendLatin1AsUtf8(out, run);
        else
            out.append(run);
    };
    std::size_t start = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        std::string_view entity;
        switch (text[i]) {
        case '&': entity = "&amp;"; break;
        case '<': entity = "&lt;"; break;
        case '>': entity = "&gt;"; break;
        case '"':
            if (kind == Escape::kAll) entity = "&quot;";
            break;
        case '\'':
            if (kind == Escape::kAll) entity = "&apos;";
            break;
        default: break;
        }
        if (entity.empty()) continue;
        copy(text.substr(start, i - start));
        out.append(entity);
        start = i + 1;
    }
    copy(text.substr(start));
}

} // namespace

void appendEscaped(std::string& out, std::string_view text) {
    appendWithEntities<Escape::kAll, false>(out, text);
}

std::string escapeXml(std::string_view text) {
    std::string escaped;
    escaped.reserve(text.size());
    appendEscaped(escaped, text);
    return escaped;
}

// --- helpers ---

namespace {

// Indentation is copied from here; deeper lines fall back to filling.
constexpr std::string_view kSpaces = "                                                                ";
constexpr std::size_t kMaxTag = 16;

// Appends indentation, "<tag>", the number that `writeNumber(char*)` writes
// (at most 16 characters) and "</tag>" with a line feed. The line is gathered on
// the stack and appended at once, as these lines make up most of a document.
template <class WriteNumber>
void appendNumberLine(std::string& out, std::size_t width, std::string_view tag, WriteNumber writeNumber) {
    char text[kSpaces.size() + 2 * kMaxTag + 32];
    char* p = text;
    if (width <= kSpaces.size()) {
        std::memcpy(p, kSpaces.data(), width);
        p += width;
    } else {
        out.append(width, ' ');
    }
    if (tag.size() > kMaxTag) { // never for the writer's own tags
        out.append(text, static_cast<std::size_t>(p - text));
        out.push_back('<');
        out.append(tag);
        out.push_back('>');
        char number[kMaxFloatChars];
        out.append(number, static_cast<std::size_t>(writeNumber(number) - number));
        out.append("</");
        out.append(tag);
        out.append(">\n");
        return;
    }
    *p++ = '<';
    std::memcpy(p, tag.data(), tag.size());
    p += tag.size();
    *p++ = '>';
    p = writeNumber(p);
    *p++ = '<';
    *p++ = '/';
    std::memcpy(p, tag.data(), tag.size());
    p += tag.size();
    *p++ = '>';
    *p++ = '\n';
    out.append(text, static_cast<std::size_t>(p - text));
}

// Appends indentation and `text` (and a line feed) with a single append when
// they fit on the stack.
void appendIndented(std::string& out, std::size_t width, std::string_view text, bool lineFeed) {
    char line[kSpaces.size() + 32];
    if (width <= kSpaces.size() && text.size() < 32) {
        std::memcpy(line, kSpaces.data(), width);
        std::memcpy(line + width, text.data(), text.size());
        std::size_t size = width + text.size();
        if (lineFeed) line[size++] = '\n';
        out.append(line, size);
        return;
    }
    out.append(width, ' ');
    out.append(text);
    if (lineFeed) out.push_back('\n');
}

} // namespace

void AssetXmlWriter::indent() {
    const std::size_t width = 2 * static_cast<std::size_t>(depth_);
    if (width <= kSpaces.size())
        out_.append(kSpaces.data(), width);
    else
        out_.append(width, ' ');
}

void AssetXmlWriter::line(std::string_view text) {
    appendIndented(out_, 2 * static_cast<std::size_t>(depth_), text, true);
}

void AssetXmlWriter::appendNarrow(std::string_view narrow) {
    text::appendLatin1AsUtf8(out_, narrow);
}

void AssetXmlWriter::inlineValue(std::string_view text) {
    beginInlineValue();
    out_.append(text);
    endInlineValue();
}

void AssetXmlWriter::floatLine(std::string_view tag, float value) {
    appendNumberLine(out_, 2 * static_cast<std::size_t>(depth_), tag,
                     [value](char* p) { return formatFloatTo(p, value); });
}

void AssetXmlWriter::integerLine(std::string_view tag, std::int32_t value) {
    appendNumberLine(out_, 2 * static_cast<std::size_t>(depth_), tag,
                     [value](char* p) { return std::to_chars(p, p + 11, value).ptr; });
}

void AssetXmlWriter::vectorBlock(const Vector& v) {
    line("<vector>");
    ++depth_;
    floatLine("x", v.x);
    floatLine("y", v.y);
    floatLine("z", v.z);
    decreaseDepth();
    line("</vector>");
}

void AssetXmlWriter::componentLines(const TransformComponents& c) {
    floatLine("x_rotation", c.x_rotation);
    floatLine("y_rotation", c.y_rotation);
    floatLine("z_rotation", c.z_rotation);
    floatLine("x_scale", c.x_scale);
    floatLine("y_scale", c.y_scale);
    floatLine("z_scale", c.z_scale);
    floatLine("x_offset", c.x_offset);
    floatLine("y_offset", c.y_offset);
    floatLine("z_offset", c.z_offset);
    integerLine("x_mirror", c.x_mirror);
    integerLine("y_mirror", c.y_mirror);
    integerLine("z_mirror", c.z_mirror);
}

void AssetXmlWriter::beginBlockParameter(std::string_view name, std::string_view type, std::string_view label) {
    beginParameter(name, type, label, "none", false);
    beginValueBlock();
    ++depth_;
}

void AssetXmlWriter::endBlockParameter() {
    decreaseDepth();
    endValueBlock();
    endParameter();
}

// The reference text: the escaped path, "/", and the last part (a material's
// escaped name, or the plugin type of the other families, widened).
void AssetXmlWriter::pluginReference(std::string_view name, std::string_view path, std::string_view last,
                                     bool escapeLast, std::string_view label) {
    beginParameter(name, "plugin", label, "none", false);
    beginInlineValue();
    appendEscaped(out_, path);
    out_.push_back('/');
    if (escapeLast)
        appendEscaped(out_, last);
    else
        appendNarrow(last);
    endInlineValue();
    endParameter();
}

// A reference to nothing: the parameter with no value line at all.
void AssetXmlWriter::emptyPlugin(std::string_view name, std::string_view label) {
    beginParameter(name, "plugin", label, "none", false);
    endParameter();
}

// --- document framing ---

void AssetXmlWriter::beginDocument() {
    out_.append("<Assets>\n");
}

// Appending to a string needs no flushing.
void AssetXmlWriter::endDocument() {
    line("</Assets>");
}

void AssetXmlWriter::beginElement(std::string_view name) {
    ++depth_;
    out_.push_back('<');
    out_.append(name);
    out_.append(">\n");
}

void AssetXmlWriter::endElement(std::string_view name) {
    out_.append("</");
    out_.append(name);
    out_.append(">\n");
    decreaseDepth();
}

void AssetXmlWriter::beginAsset(std::string_view url, std::string_view type, std::string_view layout) {
    ++depth_;
    indent();
    out_.append("<Asset layout=\"");
    appendNarrow(layout);
    out_.append("\" renderer=\"kavor\" type=\"");
    appendNarrow(type);
    out_.append("\" url=\"");
    appendEscaped(out_, url);
    out_.append("\" >\n");
}

void AssetXmlWriter::endAsset() {
    line("</Asset>");
    decreaseDepth();
}

void AssetXmlWriter::beginPlugin(std::string_view name, std::string_view type) {
    ++depth_;
    line("<plugin>");
    ++depth_;
    indent();
    out_.append("<kavorplugin name=\"");
    appendNarrow(name);
    out_.append("\" type=\"");
    appendNarrow(type);
    out_.append("\">\n");
}

void AssetXmlWriter::endPlugin() {
    line("</kavorplugin>");
    decreaseDepth();
    line("</plugin>");
    decreaseDepth();
}

void AssetXmlWriter::beginParameters() {
    ++depth_;
    line("<parameters>");
    ++depth_;
}

void AssetXmlWriter::endParameters() {
    decreaseDepth();
    line("</parameters>");
    decreaseDepth();
}

void AssetXmlWriter::beginParameter(std::string_view name, std::string_view type, std::string_view label,
                                    std::string_view listType, bool userData) {
    indent();
    out_.append("<parameter type=\"");
    appendNarrow(type);
    out_.append("\" name=\"");
    appendNarrow(name);
    out_.append("\" listType=\"");
    appendNarrow(listType);
    out_.push_back('"');
    if (userData) out_.append(" isUserData=\"1\"");
    out_.append(" label=\"");
    appendNarrow(label.empty() ? name : label);
    out_.append("\">\n");
    ++depth_;
}

void AssetXmlWriter::endParameter() {
    decreaseDepth();
    line("</parameter>");
}

void AssetXmlWriter::beginValueBlock() {
    line("<value>");
}

void AssetXmlWriter::endValueBlock() {
    line("</value>");
}

void AssetXmlWriter::beginInlineValue() {
    appendIndented(out_, 2 * static_cast<std::size_t>(depth_), "<value>", false);
}

void AssetXmlWriter::endInlineValue() {
    out_.append("</value>\n");
}

// --- typed parameters ---

void AssetXmlWriter::writeFloat(std::string_view name, float value, std::string_view label, bool userData) {
    beginParameter(name, "float", label, "none", userData);
    beginInlineValue();
    appendFloat(out_, value);
    endInlineValue();
    endParameter();
}

void AssetXmlWriter::writeInteger(std::string_view name, std::int32_t value, std::string_view label,
                                  bool userData) {
    beginParameter(name, "integer", label, "none", userData);
    beginInlineValue();
    appendInteger(out_, value);
    endInlineValue();
    endParameter();
}

void AssetXmlWriter::writeBool(std::string_view name, bool value, std::string_view label, bool userData) {
    beginParameter(name, "bool", label, "none", userData);
    inlineValue(value ? "1" : "0");
    endParameter();
}

void AssetXmlWriter::writeString(std::string_view name, std::string_view value, std::string_view label,
                                 bool userData) {
    beginParameter(name, "string", label, "none", userData);
    beginInlineValue();
    appendWithEntities<Escape::kMarkup, false>(out_, value);
    endInlineValue();
    endParameter();
}

void AssetXmlWriter::writeVector(std::string_view name, const Vector& value, std::string_view label) {
    beginBlockParameter(name, "vector", label);
    vectorBlock(value);
    endBlockParameter();
}

void AssetXmlWriter::writeColor(std::string_view name, const Color& value, std::string_view label) {
    beginBlockParameter(name, "color", label);
    floatLine("r", value.r);
    floatLine("g", value.g);
    floatLine("b", value.b);
    endBlockParameter();
}

void AssetXmlWriter::writeAColor(std::string_view name, const AColor& value, std::string_view label) {
    beginBlockParameter(name, "acolor", label);
    floatLine("r", value.r);
    floatLine("g", value.g);
    floatLine("b", value.b);
    floatLine("a", value.a);
    endBlockParameter();
}

// The matrix element follows an empty line.
void AssetXmlWriter::writeMatrix(std::string_view name, const Matrix& value, std::string_view label) {
    beginBlockParameter(name, "matrix", label);
    out_.push_back('\n');
    line("<matrix>");
    ++depth_;
    for (const Vector& column : value.m) vectorBlock(column);
    decreaseDepth();
    line("</matrix>");
    endBlockParameter();
}

// The three matrix columns and then the offset, with no enclosing element.
void AssetXmlWriter::writeTransform(std::string_view name, const Transform& value, std::string_view label) {
    beginBlockParameter(name, "transform", label);
    for (const Vector& column : value.m.m) vectorBlock(column);
    vectorBlock(value.offs);
    endBlockParameter();
}

void AssetXmlWriter::writeComponentMatrix(std::string_view name, const TransformComponents& value,
                                          std::string_view label) {
    beginBlockParameter(name, "componentMatrix", label);
    componentLines(value);
    endBlockParameter();
}

void AssetXmlWriter::writeComponentTransform(std::string_view name, const TransformComponents& value,
                                             std::string_view label) {
    beginBlockParameter(name, "componentTransform", label);
    componentLines(value);
    endBlockParameter();
}

// --- plugin parameters ---

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseTexture>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseUVW>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseCamera>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseBitmap>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseLight>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::shared_ptr<BaseMaterial>& object,
                                 std::string_view path, std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->name, true, label);
}

// An absent sun refers to nothing, like an absent object of any other family.
void AssetXmlWriter::writeSunPlugin(std::string_view name, const boost::shared_ptr<BaseLight>& sun,
                                    std::string_view url, std::string_view label) {
    if (!sun) return emptyPlugin(name, label);
    beginParameter(name, "plugin", label, "none", false);
    beginInlineValue();
    appendEscaped(out_, url);
    endInlineValue();
    endParameter();
}

void AssetXmlWriter::writePlugin(std::string_view name, const boost::any& object, std::string_view path,
                                 std::string_view label) {
    // The families in the order they are tried.
    if (const auto* texture = boost::any_cast<boost::shared_ptr<BaseTexture>>(&object))
        return writePlugin(name, *texture, path, label);
    if (const auto* material = boost::any_cast<boost::shared_ptr<BaseMaterial>>(&object))
        return writePlugin(name, *material, path, label);
    if (const auto* uvw = boost::any_cast<boost::shared_ptr<BaseUVW>>(&object))
        return writePlugin(name, *uvw, path, label);
    if (const auto* camera = boost::any_cast<boost::shared_ptr<BaseCamera>>(&object))
        return writePlugin(name, *camera, path, label);
    if (const auto* bitmap = boost::any_cast<boost::shared_ptr<BaseBitmap>>(&object))
        return writePlugin(name, *bitmap, path, label);
    if (const auto* light = boost::any_cast<boost::shared_ptr<BaseLight>>(&object))
        return writePlugin(name, *light, path, label);
    throw std::invalid_argument("plugin parameter \"" + std::string(name) +
                                "\": the value holds no object of a plugin family (held type " +
                                object.type().name() + ")");
}

// --- lists ---

// "<list>" stands at the level of "<value>"; the entries one level deeper.
void AssetXmlWriter::beginList(std::string_view name, std::string_view listType, std::string_view label) {
    beginParameter(name, "list", label, listType, false);
    beginValueBlock();
    line("<list>");
    ++depth_;
}

void AssetXmlWriter::writeEntry(std::string_view text) {
    indent();
    out_.append("<entry>");
    appendEscaped(out_, text);
    out_.append("</entry>\n");
}

void AssetXmlWriter::writeStringEntry(std::string_view text) {
    indent();
    out_.append("<string>\"");
    appendWithEntities<Escape::kMarkup, true>(out_, text);
    out_.append("\"</string>\n");
}

void AssetXmlWriter::endList() {
    decreaseDepth();
    line("</list>");
    endValueBlock();
    endParameter();
}

} // namespace OrvexKavorCore
