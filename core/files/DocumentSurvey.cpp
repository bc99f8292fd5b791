#include "files/DocumentSurvey.hpp"

#include "xml/XmlCharacters.hpp"

#include <algorithm>

namespace OrvexKavorCore {

namespace {

// The value of attribute `name` in an element's line, escaped as written.
std::string_view attribute(std::string_view line, std::string_view name) {
    for (auto at = line.find(name); at != std::string_view::npos; at = line.find(name, at + 1)) {
        const auto start = at + name.size() + 2; // past name="
        if (at == 0 || line[at - 1] != ' ' || line.substr(at + name.size()).substr(0, 2) != "=\"") continue;
        const auto end = line.find('"', start);
        return end == std::string_view::npos ? std::string_view() : line.substr(start, end - start);
    }
    return {};
}

// The text between <tag> and </tag> on a line that holds just that element.
std::optional<std::string_view> contentOf(std::string_view line, std::string_view tag) {
    const std::size_t open = tag.size() + 2, close = tag.size() + 3;
    if (line.size() < open + close || line[0] != '<' || line.substr(1, tag.size()) != tag || line[open - 1] != '>')
        return std::nullopt;
    const std::string_view end = line.substr(line.size() - close);
    if (end.substr(0, 2) != "</" || end.substr(2, tag.size()) != tag || end.back() != '>') return std::nullopt;
    return line.substr(open, line.size() - open - close);
}

// The text an escaped value stands for.
std::string unescaped(std::string_view text) {
    static constexpr std::pair<std::string_view, char> kEntities[] = {
        {"&quot;", '"'}, {"&apos;", '\''}, {"&lt;", '<'}, {"&gt;", '>'}, {"&amp;", '&'}};
    std::string plain;
    plain.reserve(text.size());
    for (std::size_t i = 0; i < text.size();) {
        bool replaced = false;
        if (text[i] == '&')
            for (const auto& [entity, c] : kEntities)
                if (text.substr(i).starts_with(entity)) {
                    plain += c;
                    i += entity.size();
                    replaced = true;
                    break;
                }
        if (!replaced) plain += text[i++];
    }
    return plain;
}

// A url in a warning: quoted, with the characters XML cannot carry shown as escapes.
std::string quotedUrl(std::string_view url) {
    std::string shown = "\"";
    for (const char c : url) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x20) {
            static constexpr char kHex[] = "0123456789abcdef";
            shown += "\\x";
            shown += kHex[byte >> 4];
            shown += kHex[byte & 15];
        } else {
            shown += c;
        }
    }
    return shown + "\"";
}

// Whether a line ends inside an element the writer puts on one line: a name with
// a line break in an attribute or a value goes on to the next line.
bool unfinished(std::string_view line) {
    line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
    if (line.starts_with("<Asset ") || line.starts_with("<kavorplugin ") || line.starts_with("<parameter "))
        return !line.ends_with('>');
    for (const std::string_view tag : {"value", "entry"}) {
        const std::size_t open = tag.size() + 2;
        if (line.size() > open && line[0] == '<' && line.substr(1, tag.size()) == tag && line[open - 1] == '>' &&
            !contentOf(line, tag))
            return true;
    }
    return false;
}

} // namespace

void DocumentSurvey::beginMaterial(std::string name, std::string kind) {
    materials_.push_back(MaterialSummary{std::move(name), std::move(kind), std::nullopt});
    lastAsset_.clear();
}

void DocumentSurvey::reset() { *this = DocumentSurvey(); }

void DocumentSurvey::take(std::string_view text) {
    while (!text.empty()) {
        const auto end = text.find('\n');
        if (end == std::string_view::npos) {
            partial_.append(text);
            return;
        }
        const std::string_view piece = text.substr(0, end);
        text.remove_prefix(end + 1);
        if (partial_.empty() && !unfinished(piece)) {
            line(piece);
            continue;
        }
        partial_.append(piece);
        if (unfinished(partial_)) {
            partial_ += '\n';
            continue;
        }
        line(partial_);
        partial_.clear();
    }
}

void DocumentSurvey::line(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
    const int material = static_cast<int>(materials_.size()) - 1;
    if (expecting_ == Expecting::PluginValue) {
        expecting_ = Expecting::Nothing;
        if (const auto value = contentOf(text, "value")) return references_.push_back({unescaped(*value), material});
    }
    if (expecting_ == Expecting::PluginEntries) {
        if (const auto entry = contentOf(text, "entry")) return references_.push_back({unescaped(*entry), material});
        if (text == "</list>") expecting_ = Expecting::Nothing;
        return;
    }
    // A reference names a url, whose asset the lint looks at (or it names none).
    if (!text.starts_with("<Asset ") && holdsCharacterXmlCannotCarry(text)) noteUncarriable(material);
    if (text.starts_with("<Asset ")) {
        lastAsset_ = unescaped(attribute(text, "url"));
        parameter_.clear();
        const std::string_view type = attribute(text, "type");
        assets_[lastAsset_].push_back(material);
        targets_.insert(lastAsset_);
        if (type == "settings") settings_.push_back(lastAsset_);
        if (type == "material" && material >= 0) materials_[static_cast<std::size_t>(material)].assetUrl = lastAsset_;
    } else if (text.starts_with("<kavorplugin ")) {
        targets_.insert(lastAsset_ + "/" + unescaped(attribute(text, "name")));
    } else if (text.starts_with("<parameter ")) {
        parameter_ = unescaped(attribute(text, "name"));
        if (attribute(text, "type") == "plugin") expecting_ = Expecting::PluginValue;
        if (attribute(text, "type") == "list" && attribute(text, "listType") == "plugin")
            expecting_ = Expecting::PluginEntries;
    }
}

// Once for each parameter (a text may span lines; a list has many entries).
void DocumentSurvey::noteUncarriable(int material) {
    std::string warning = whereOf(material) + ": the parameter " + quotedUrl(parameter_) + " of the asset " +
                          quotedUrl(lastAsset_) + " holds a character XML 1.0 cannot carry";
    if (uncarriable_.empty() || uncarriable_.back() != warning) uncarriable_.push_back(std::move(warning));
}

std::string DocumentSurvey::whereOf(int material) const {
    if (material < 0) return "the document";
    return "material " + std::to_string(material) + " \"" + materials_[static_cast<std::size_t>(material)].name + "\"";
}

std::vector<std::string> DocumentSurvey::warnings() const {
    std::vector<std::string> found;
    for (const auto& [url, holders] : assets_) {
        if (holders.size() > 1)
            found.push_back(whereOf(holders.front()) + ": the url " + quotedUrl(url) + " is given to " +
                            std::to_string(holders.size()) + " assets");
        if (holdsCharacterXmlCannotCarry(url))
            found.push_back(whereOf(holders.front()) + ": the url " + quotedUrl(url) +
                            " holds a character XML 1.0 cannot carry");
    }
    for (const Reference& reference : references_)
        if (!targets_.contains(reference.target))
            found.push_back(whereOf(reference.material) + ": the reference " + quotedUrl(reference.target) +
                            " names no asset of the document");
    found.insert(found.end(), uncarriable_.begin(), uncarriable_.end());
    return found;
}

std::vector<MaterialSummary> DocumentSurvey::materials() const { return materials_; }

} // namespace OrvexKavorCore
