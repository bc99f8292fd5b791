#include "xml/XmlCharacters.hpp"

#include <array>

namespace OrvexKavorCore {

namespace {

enum class Verdict { Carriable, Uncarriable, Cut };

struct Step {
    std::size_t length; // of the character, or of the ill-formed part to replace
    Verdict verdict;
};

// The character at the start of `text` (not empty).
Step stepAt(std::string_view text) {
    const auto byte = [text](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    const unsigned char lead = byte(0);
    if (lead < 0x80)
        return {1, lead >= 0x20 || lead == '\t' || lead == '\n' || lead == '\r' ? Verdict::Carriable
                                                                              : Verdict::Uncarriable};
    // The length a lead byte announces, and the range of the byte after it that
    // keeps the sequence short-form, below U+110000 and off the surrogates.
    std::size_t length = 0;
    unsigned char low = 0x80, high = 0xBF;
    if (lead >= 0xC2 && lead <= 0xDF) {
        length = 2;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3;
        if (lead == 0xE0) low = 0xA0;
        if (lead == 0xED) high = 0x9F;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4;
        if (lead == 0xF0) low = 0x90;
        if (lead == 0xF4) high = 0x8F;
    } else {
        return {1, Verdict::Uncarriable};
    }
    for (std::size_t i = 1; i < length; ++i) {
        if (i == text.size()) return {i, Verdict::Cut};
        const unsigned char c = byte(i);
        if (c < (i == 1 ? low : 0x80) || c > (i == 1 ? high : 0xBF)) return {i, Verdict::Uncarriable};
    }
    // U+FFFE and U+FFFF: EF BF BE and EF BF BF.
    if (lead == 0xEF && byte(1) == 0xBF && byte(2) >= 0xBE) return {3, Verdict::Uncarriable};
    return {length, Verdict::Carriable};
}

// The bytes the wrapped form may change or must follow: controls, the markup a
// carrier tracks, and the bytes of characters beyond ASCII.
constexpr std::array<bool, 256> kNotes = [] {
    std::array<bool, 256> notes{};
    for (int c = 0; c < 256; ++c) notes[c] = c < 0x20 || c >= 0x80 || c == '<' || c == '>' || c == '"';
    return notes;
}();

} // namespace

bool holdsCharacterXmlCannotCarry(std::string_view text) {
    for (std::size_t i = 0; i < text.size();) {
        const Step step = stepAt(text.substr(i));
        if (step.verdict != Verdict::Carriable) return true;
        i += step.length;
    }
    return false;
}

std::size_t XmlCarrier::append(std::string& out, std::string_view text, bool complete) {
    std::size_t start = 0;
    const auto replace = [&](std::size_t at, std::size_t length, std::string_view by) {
        out.append(text.substr(start, at - start));
        out.append(by);
        start = at + length;
    };
    for (std::size_t i = 0; i < text.size();) {
        const char c = text[i];
        if (!kNotes[static_cast<unsigned char>(c)]) {
            ++i;
            continue;
        }
        if (c == '<' && !inValue_) {
            inTag_ = true;
        } else if (c == '>' && !inValue_) {
            inTag_ = false;
        } else if (c == '"' && inTag_) {
            inValue_ = !inValue_;
        } else if (c == '\r' || ((c == '\t' || c == '\n') && inValue_)) {
            replace(i, 1, c == '\t' ? "&#9;" : c == '\n' ? "&#10;" : "&#13;");
        } else if (c != '\t' && c != '\n') {
            const Step step = stepAt(text.substr(i));
            if (step.verdict == Verdict::Cut && !complete) {
                out.append(text.substr(start, i - start));
                return text.size() - i;
            }
            if (step.verdict != Verdict::Carriable) replace(i, step.length, "\xEF\xBF\xBD");
            i += step.length;
            continue;
        }
        ++i;
    }
    out.append(text.substr(start));
    return 0;
}

} // namespace OrvexKavorCore
