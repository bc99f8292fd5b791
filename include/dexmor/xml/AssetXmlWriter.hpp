#pragma once
// AssetXmlWriter: writes the XML asset document.
//
// A document is a list of assets, each describing one renderer plugin with typed
// parameters. The writer appends UTF-8 text to a std::string it does not own; it
// never uses iostreams. Narrow strings (plugin types, asset types, layouts,
// parameter names, labels) are widened byte for byte; wide strings (urls, names,
// string values) are UTF-8 already.
//
// Text of the document, line by line, with two spaces of indentation per level:
//   <Assets>
//     <Asset layout="defkvmat" renderer="kavor" type="material" url="/Oak" >
//       <plugin>
//         <kavorplugin name="MtlORVEX" type="material">
//           <parameters>
//             <parameter type="integer" name="double_sided" listType="none" label="double_sided">
//               <value>1</value>
//             </parameter>
//           </parameters>
//         </kavorplugin>
//       </plugin>
//     </Asset>
//   </Assets>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/xml/OutputWatch.hpp>

#include <boost/shared_ptr.hpp>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string>
#include <string_view>

struct OrvexXMLSerializable;

namespace OrvexKavorCore {


// Appends `text` with the five XML entities for " & ' < >.
void appendEscaped(std::string& out, std::string_view text);
std::string escapeXml(std::string_view text);

class AssetXmlWriter {
public:
    explicit AssetXmlWriter(std::string& output) : out_(output) {}

    std::string& output() { return out_; }

    // Hands the output to `watch` whenever it holds `threshold` bytes or more, and
    // then at the threshold the watch returns (checked whenever pending text is
    // added, every few kilobytes; a watch that sends the text on keeps the output
    // near the threshold however large the document). The watch must outlive the
    // writer's use; nullptr stops watching.
    void watchOutput(OutputWatch* watch, std::size_t threshold);
    std::uint32_t depth() const { return depth_; }

    // --- document framing ---
    void beginDocument();
    void endDocument();
    void beginElement(std::string_view name);
    void endElement(std::string_view name);
    void beginAsset(std::string_view url, std::string_view type, std::string_view layout);
    void endAsset();
    void beginPlugin(std::string_view name, std::string_view type);
    void endPlugin();
    void beginParameters();
    void endParameters();
    void beginParameter(std::string_view name, std::string_view type, std::string_view label,
                        std::string_view listType, bool userData);
    void endParameter();
    void beginValueBlock();
    void endValueBlock();
    void beginInlineValue();
    void endInlineValue();
    void writeText(std::string_view text);
    void increaseDepth() { ++depth_; }
    // Never below 0: an unbalanced end must not wrap the depth into billions of spaces.
    void decreaseDepth() {
        if (depth_ > 0) --depth_;
    }

    // --- typed parameters (an empty label repeats the name) ---
    void writeFloat(std::string_view name, float value, std::string_view label = {}, bool userData = false);
    void writeInteger(std::string_view name, std::int32_t value, std::string_view label = {}, bool userData = false);
    void writeBool(std::string_view name, bool value, std::string_view label = {}, bool userData = false);
    // The text is written with & < > escaped, so that every document is well-formed.
    void writeString(std::string_view name, std::string_view value, std::string_view label = {},
                     bool userData = false);
    void writeVector(std::string_view name, const Vector& value, std::string_view label = {});
    void writeColor(std::string_view name, const Color& value, std::string_view label = {});
    void writeAColor(std::string_view name, const AColor& value, std::string_view label = {});
    void writeMatrix(std::string_view name, const Matrix& value, std::string_view label = {});
    void writeTransform(std::string_view name, const Transform& value, std::string_view label = {});
    // A parameter whose value is a block of numbered lines, one "<tag>number</tag>"
    // each (the components of a transform).
    struct NumberLine {
        std::string_view tag;
        double value;           // a float or a 32-bit integer, held exactly
        bool isInteger = false; // written as an integer, else as a float
    };
    void writeNumberBlock(std::string_view name, std::string_view type, std::span<const NumberLine> lines,
                          std::string_view label = {});

    // "plugin" parameters. The value is the escaped `path`, "/", and the object's
    // plugin type. An absent object writes the parameter without a value.
    void writePlugin(std::string_view name, const OrvexXMLSerializable* object, std::string_view path,
                     std::string_view label = {});
    template <class Object>
        requires(!requires { Object::kReferencedByName; }) // a material goes by its name: writePluginByName
    void writePlugin(std::string_view name, const boost::shared_ptr<Object>& object, std::string_view path,
                     std::string_view label = {}) {
        writePlugin(name, static_cast<const OrvexXMLSerializable*>(object.get()), path, label);
    }
    // A plugin known by its object's name (a material): the value is the escaped
    // `path`, "/" and the escaped name; no name (an absent object) writes the
    // parameter without a value.
    void writePluginByName(std::string_view name, std::string_view path, const std::string* objectName,
                           std::string_view label = {});
    // A plugin at a known url (a sun light: the url the document gave it), escaped.
    void writePluginUrl(std::string_view name, bool present, std::string_view url, std::string_view label = {});

    // --- lists ---
    void beginList(std::string_view name, std::string_view listType, std::string_view label = {});
    // <entry>escaped text</entry>
    void writeEntry(std::string_view text);
    // <string>"text"</string>, the text with & < > escaped.
    void writeStringEntry(std::string_view text);
    void endList();

private:
    // Text is gathered in `pending_` and appended to the output a piece at a time:
    // a parameter is a few short lines, and one append costs far less than the
    // dozen its parts would take. Every public member function ends with flush(),
    // so that the output is complete whenever the caller sees it.
    static constexpr std::size_t kPendingSize = 2048;
    void put(std::string_view text) {
        if (kPendingSize - pendingSize_ < text.size()) return putLong(text);
        copyShort(pending_ + pendingSize_, text.data(), text.size());
        pendingSize_ += text.size();
    }
    void put(char c) {
        if (pendingSize_ == kPendingSize) flush();
        pending_[pendingSize_++] = c;
    }
    void putLong(std::string_view text);
    // Copies `size` bytes with two overlapping loads and stores of a width that
    // fits: most pieces are a tag, a name or a number of under 32 bytes, where a
    // call into the C library costs more than the copy.
    static void copyShort(char* to, const char* from, std::size_t size) {
        const auto pair = [&]<std::size_t kWidth>() {
            char head[kWidth], tail[kWidth];
            std::memcpy(head, from, kWidth);
            std::memcpy(tail, from + size - kWidth, kWidth);
            std::memcpy(to, head, kWidth);
            std::memcpy(to + size - kWidth, tail, kWidth);
        };
        if (size > 32)
            std::memcpy(to, from, size);
        else if (size >= 16)
            pair.template operator()<16>();
        else if (size >= 8)
            pair.template operator()<8>();
        else if (size >= 4)
            pair.template operator()<4>();
        else if (size > 0) {
            to[0] = from[0];
            to[size / 2] = from[size / 2];
            to[size - 1] = from[size - 1];
        }
    }
    // Latin-1 text, widened to UTF-8.
    void putNarrow(std::string_view narrow);
    template <bool kAllEntities, bool kNarrow>
    void putWithEntities(std::string_view text);
    // At least `size` (at most kPendingSize) free bytes at the returned position;
    // advance(end) takes what was written there.
    char* room(std::size_t size) {
        if (kPendingSize - pendingSize_ < size) flush();
        return pending_ + pendingSize_;
    }
    void advance(char* end) { pendingSize_ = static_cast<std::size_t>(end - pending_); }
    void flush();
    void checkGrowth() {
        if (out_.size() >= watchAt_) watchAt_ = watch_->grown(out_);
    }

    // Two spaces per level. Up to 32 levels, a fixed run of spaces is stored and
    // only the indentation kept, which needs no loop and no call.
    void indent() {
        constexpr std::size_t kShallow = 64;
        const std::size_t width = 2 * static_cast<std::size_t>(depth_);
        if (width > kShallow) return indentDeep();
        char* at = room(kShallow);
        std::memset(at, ' ', kShallow);
        advance(at + width);
    }
    void indentDeep();
    void line(std::string_view text); // indent, text, line feed
    // `ownTypeWords`: the type and list type are the writer's own ASCII words.
    void parameterStart(std::string_view name, std::string_view type, std::string_view label,
                        std::string_view listType, bool userData, bool ownTypeWords = true);
    void parameterEnd();
    void inlineValueStart();
    void inlineValueEnd() { put("</value>\n"); }
    void inlineValue(std::string_view text);
    template <class WriteNumber>
    void numberLine(std::string_view tag, WriteNumber writeNumber);
    void floatLine(std::string_view tag, float value);
    void integerLine(std::string_view tag, std::int32_t value);
    void beginBlockParameter(std::string_view name, std::string_view type, std::string_view label);
    void endBlockParameter();
    void vectorBlock(const Vector& v);
    void pluginReference(std::string_view name, std::string_view path, std::string_view last, bool escapeLast,
                         std::string_view label);
    void emptyPlugin(std::string_view name, std::string_view label);

    std::string& out_;
    char pending_[kPendingSize];
    std::size_t pendingSize_ = 0;
    std::uint32_t depth_ = 0;
    OutputWatch* watch_ = nullptr;
    std::size_t watchAt_ = kUnwatched;
    static constexpr std::size_t kUnwatched = ~std::size_t{0};
};

} // namespace OrvexKavorCore
