#include "xml/AssetXmlWriter.hpp"

#include "lights/BaseLight.hpp"
#include "materials/BaseMaterial.hpp"
#include "options/BaseCamera.hpp"
#include "params/TransformComponents.hpp"
#include "platform/HugePages.hpp"
#include "platform/Text.hpp"
#include "textures/BaseBitmap.hpp"
#include "textures/BaseTexture.hpp"
#include "textures/BaseUVW.hpp"
#include "xml/NumberFormat.hpp"

#include <array>
#include <charconv>
#include <cstring>
#include <stdexcept>

namespace OrvexKavorCore {

namespace {

// Indentation is copied from here, in pieces for deeper lines.
constexpr std::string_view kSpaces = "                                                                ";

// Which bytes an escaping replaces: all five of XML's predefined entities
// (attribute values and entries), or only & < > (element text, which keeps its
// quotes and apostrophes).
template <bool kAllEntities>
constexpr std::array<bool, 256> kNeedsEntity = [] {
    std::array<bool, 256> needs{};
    needs['&'] = needs['<'] = needs['>'] = true;
    needs['"'] = needs['\''] = kAllEntities;
    return needs;
}();

std::string_view entityFor(char c) {
    switch (c) {
    case '&': return "&amp;";
    case '<': return "&lt;";
    case '>': return "&gt;";
    case '"': return "&quot;";
    default: return "&apos;";
    }
}

// Calls `copy` on each run of `text` without entities and `entity` for each
// character that needs one. Every replaced character is ASCII, so escaping a
// narrow text before widening it is the same as escaping after.
template <bool kAllEntities, class Copy, class Entity>
void splitAtEntities(std::string_view text, Copy copy, Entity entity) {
    std::size_t start = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (!kNeedsEntity<kAllEntities>[static_cast<unsigned char>(text[i])]) continue;
        copy(text.substr(start, i - start));
        entity(entityFor(text[i]));
        start = i + 1;
    }
    copy(text.substr(start));
}

} // namespace

void appendEscaped(std::string& out, std::string_view text) {
    const auto append = [&out](std::string_view piece) { out.append(piece); };
    splitAtEntities<true>(text, append, append);
}

std::string escapeXml(std::string_view text) {
    std::string escaped;
    escaped.reserve(text.size());
    appendEscaped(escaped, text);
    return escaped;
}

// --- the pending text ---

void AssetXmlWriter::flush() {
    reserveForAppend(out_, pendingSize_);
    out_.append(pending_, pendingSize_);
    pendingSize_ = 0;
}

void AssetXmlWriter::putLong(std::string_view text) {
    flush();
    if (text.size() <= kPendingSize) return put(text);
    out_.append(text);
}

void AssetXmlWriter::putNarrow(std::string_view narrow) {
    if (text::isAscii(narrow)) return put(narrow);
    flush();
    text::appendLatin1AsUtf8(out_, narrow);
}

template <bool kAllEntities, bool kNarrow>
void AssetXmlWriter::putWithEntities(std::string_view text) {
    const auto copy = [this](std::string_view run) {
        if constexpr (kNarrow)
            putNarrow(run);
        else
            put(run);
    };
    splitAtEntities<kAllEntities>(text, copy, [this](std::string_view entity) { put(entity); });
}

void AssetXmlWriter::writeText(std::string_view text) {
    put(text);
    flush();
}

// --- helpers ---

void AssetXmlWriter::indentDeep() {
    std::size_t width = 2 * static_cast<std::size_t>(depth_);
    for (; width > kSpaces.size(); width -= kSpaces.size()) put(kSpaces);
    put(kSpaces.substr(0, width));
}

void AssetXmlWriter::line(std::string_view text) {
    indent();
    put(text);
    put('\n');
}

void AssetXmlWriter::inlineValueStart() {
    indent();
    put("<value>");
}

void AssetXmlWriter::inlineValue(std::string_view text) {
    inlineValueStart();
    put(text);
    inlineValueEnd();
}

// Indentation, "<tag>", the number `writeNumber(char*)` writes (at most
// kMaxFloatChars characters) and "</tag>" with a line feed.
template <class WriteNumber>
void AssetXmlWriter::numberLine(std::string_view tag, WriteNumber writeNumber) {
    indent();
    put('<');
    put(tag);
    put('>');
    advance(writeNumber(room(kMaxFloatChars)));
    put("</");
    put(tag);
    put(">\n");
}

void AssetXmlWriter::floatLine(std::string_view tag, float value) {
    numberLine(tag, [value](char* p) { return formatFloatTo(p, value); });
}

void AssetXmlWriter::integerLine(std::string_view tag, std::int32_t value) {
    numberLine(tag, [value](char* p) { return std::to_chars(p, p + 11, value).ptr; });
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

void AssetXmlWriter::parameterStart(std::string_view name, std::string_view type, std::string_view label,
                                    std::string_view listType, bool userData, bool ownTypeWords) {
    const auto putTypeWord = [&](std::string_view word) { ownTypeWords ? put(word) : putNarrow(word); };
    indent();
    put("<parameter type=\"");
    putTypeWord(type);
    put("\" name=\"");
    putNarrow(name);
    put("\" listType=\"");
    putTypeWord(listType);
    put('"');
    if (userData) put(" isUserData=\"1\"");
    put(" label=\"");
    putNarrow(label.empty() ? name : label);
    put("\">\n");
    ++depth_;
}

void AssetXmlWriter::parameterEnd() {
    decreaseDepth();
    line("</parameter>");
}

void AssetXmlWriter::beginBlockParameter(std::string_view name, std::string_view type, std::string_view label) {
    parameterStart(name, type, label, "none", false);
    line("<value>");
    ++depth_;
}

void AssetXmlWriter::endBlockParameter() {
    decreaseDepth();
    line("</value>");
    parameterEnd();
    flush();
}

// The reference text: the escaped path, "/", and the last part (a material's
// escaped name, or the plugin type of the other families, widened).
void AssetXmlWriter::pluginReference(std::string_view name, std::string_view path, std::string_view last,
                                     bool escapeLast, std::string_view label) {
    parameterStart(name, "plugin", label, "none", false);
    inlineValueStart();
    putWithEntities<true, false>(path);
    put('/');
    if (escapeLast)
        putWithEntities<true, false>(last);
    else
        putNarrow(last);
    inlineValueEnd();
    parameterEnd();
    flush();
}

// A reference to nothing: the parameter with no value line at all.
void AssetXmlWriter::emptyPlugin(std::string_view name, std::string_view label) {
    parameterStart(name, "plugin", label, "none", false);
    parameterEnd();
    flush();
}

// --- document framing ---

void AssetXmlWriter::beginDocument() {
    put("<Assets>\n");
    flush();
}

void AssetXmlWriter::endDocument() {
    line("</Assets>");
    flush();
}

void AssetXmlWriter::beginElement(std::string_view name) {
    ++depth_;
    put('<');
    put(name);
    put(">\n");
    flush();
}

void AssetXmlWriter::endElement(std::string_view name) {
    put("</");
    put(name);
    put(">\n");
    decreaseDepth();
    flush();
}

void AssetXmlWriter::beginAsset(std::string_view url, std::string_view type, std::string_view layout) {
    ++depth_;
    indent();
    put("<Asset layout=\"");
    putNarrow(layout);
    put("\" renderer=\"kavor\" type=\"");
    putNarrow(type);
    put("\" url=\"");
    putWithEntities<true, false>(url);
    put("\" >\n");
    flush();
}

void AssetXmlWriter::endAsset() {
    line("</Asset>");
    decreaseDepth();
    flush();
}

void AssetXmlWriter::beginPlugin(std::string_view name, std::string_view type) {
    ++depth_;
    line("<plugin>");
    ++depth_;
    indent();
    put("<kavorplugin name=\"");
    putNarrow(name);
    put("\" type=\"");
    putNarrow(type);
    put("\">\n");
    flush();
}

void AssetXmlWriter::endPlugin() {
    line("</kavorplugin>");
    decreaseDepth();
    line("</plugin>");
    decreaseDepth();
    flush();
}

void AssetXmlWriter::beginParameters() {
    ++depth_;
    line("<parameters>");
    ++depth_;
    flush();
}

void AssetXmlWriter::endParameters() {
    decreaseDepth();
    line("</parameters>");
    decreaseDepth();
    flush();
}

void AssetXmlWriter::beginParameter(std::string_view name, std::string_view type, std::string_view label,
                                    std::string_view listType, bool userData) {
    parameterStart(name, type, label, listType, userData, false);
    flush();
}

void AssetXmlWriter::endParameter() {
    parameterEnd();
    flush();
}

void AssetXmlWriter::beginValueBlock() {
    line("<value>");
    flush();
}

void AssetXmlWriter::endValueBlock() {
    line("</value>");
    flush();
}

void AssetXmlWriter::beginInlineValue() {
    inlineValueStart();
    flush();
}

void AssetXmlWriter::endInlineValue() {
    inlineValueEnd();
    flush();
}

// --- typed parameters ---

void AssetXmlWriter::writeFloat(std::string_view name, float value, std::string_view label, bool userData) {
    parameterStart(name, "float", label, "none", userData);
    inlineValueStart();
    advance(formatFloatTo(room(kMaxFloatChars), value));
    inlineValueEnd();
    parameterEnd();
    flush();
}

void AssetXmlWriter::writeInteger(std::string_view name, std::int32_t value, std::string_view label,
                                  bool userData) {
    parameterStart(name, "integer", label, "none", userData);
    inlineValueStart();
    char* p = room(11);
    advance(std::to_chars(p, p + 11, value).ptr);
    inlineValueEnd();
    parameterEnd();
    flush();
}

void AssetXmlWriter::writeBool(std::string_view name, bool value, std::string_view label, bool userData) {
    parameterStart(name, "bool", label, "none", userData);
    inlineValue(value ? "1" : "0");
    parameterEnd();
    flush();
}

void AssetXmlWriter::writeString(std::string_view name, std::string_view value, std::string_view label,
                                 bool userData) {
    parameterStart(name, "string", label, "none", userData);
    inlineValueStart();
    putWithEntities<false, false>(value);
    inlineValueEnd();
    parameterEnd();
    flush();
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
    put('\n');
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
    parameterStart(name, "plugin", label, "none", false);
    inlineValueStart();
    putWithEntities<true, false>(url);
    inlineValueEnd();
    parameterEnd();
    flush();
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
    parameterStart(name, "list", label, listType, false, false);
    line("<value>");
    line("<list>");
    ++depth_;
    flush();
}

void AssetXmlWriter::writeEntry(std::string_view text) {
    indent();
    put("<entry>");
    putWithEntities<true, false>(text);
    put("</entry>\n");
    flush();
}

void AssetXmlWriter::writeStringEntry(std::string_view text) {
    indent();
    put("<string>\"");
    putWithEntities<false, true>(text);
    put("\"</string>\n");
    flush();
}

void AssetXmlWriter::endList() {
    decreaseDepth();
    line("</list>");
    line("</value>");
    parameterEnd();
    flush();
}

} // namespace OrvexKavorCore
