#include <dexmor/xml/AssetXmlWriter.hpp>

#include <dexmor/platform/Text.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include "platform/HugePages.hpp"
#include "xml/NumberFormat.hpp"

#include <array>
#include <charconv>
#include <cstring>

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
    checkGrowth();
}

void AssetXmlWriter::watchOutput(OutputWatch* watch, std::size_t threshold) {
    flush();
    watch_ = watch;
    watchAt_ = watch ? threshold : kUnwatched;
    if (watch_) checkGrowth();
}

void AssetXmlWriter::putLong(std::string_view text) {
    flush();
    // Long text goes out in pieces of the pending store's size, so that a piece
    // sent on stays near the streaming size however long one name is.
    while (text.size() > kPendingSize) {
        put(text.substr(0, kPendingSize));
        flush();
        text.remove_prefix(kPendingSize);
    }
    put(text);
}

void AssetXmlWriter::putNarrow(std::string_view narrow) {
    if (text::isAscii(narrow)) return put(narrow);
    // Latin-1 widens each byte to at most two: in runs that fit the pending store.
    constexpr std::size_t kRun = kPendingSize / 2;
    while (!narrow.empty()) {
        const std::string_view run = narrow.substr(0, kRun);
        flush();
        text::appendLatin1AsUtf8(out_, run);
        narrow.remove_prefix(run.size());
    }
    checkGrowth();
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

void AssetXmlWriter::writeNumberBlock(std::string_view name, std::string_view type,
                                      std::span<const NumberLine> lines, std::string_view label) {
    beginBlockParameter(name, type, label);
    for (const NumberLine& l : lines) {
        if (l.isInteger)
            integerLine(l.tag, static_cast<std::int32_t>(l.value));
        else
            floatLine(l.tag, static_cast<float>(l.value));
    }
    endBlockParameter();
}

// --- plugin parameters ---

void AssetXmlWriter::writePlugin(std::string_view name, const OrvexXMLSerializable* object, std::string_view path,
                                 std::string_view label) {
    if (!object) return emptyPlugin(name, label);
    pluginReference(name, path, object->pluginType(), false, label);
}

void AssetXmlWriter::writePluginByName(std::string_view name, std::string_view path, const std::string* objectName,
                                       std::string_view label) {
    if (!objectName) return emptyPlugin(name, label);
    pluginReference(name, path, *objectName, true, label);
}

// An absent object refers to nothing, like an absent object of any other family.
void AssetXmlWriter::writePluginUrl(std::string_view name, bool present, std::string_view url,
                                    std::string_view label) {
    if (!present) return emptyPlugin(name, label);
    parameterStart(name, "plugin", label, "none", false);
    inlineValueStart();
    putWithEntities<true, false>(url);
    inlineValueEnd();
    parameterEnd();
    flush();
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
