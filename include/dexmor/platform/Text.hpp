#pragma once
// Text helpers. All text of the model is UTF-8 in std::string; these functions are
// the edges where other encodings meet it.
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace OrvexKavorCore::text {

// Whether every byte is below 0x80, looked at eight bytes at a time.
inline bool isAscii(std::string_view bytes) {
    const char* p = bytes.data();
    std::size_t n = bytes.size();
    std::uint64_t seen = 0;
    for (; n >= 8; p += 8, n -= 8) {
        std::uint64_t word;
        std::memcpy(&word, p, 8);
        seen |= word;
    }
    for (; n > 0; ++p, --n) seen |= static_cast<unsigned char>(*p);
    return (seen & 0x8080808080808080ull) == 0;
}

// True when the bytes are well-formed UTF-8: no overlong forms, no surrogates,
// nothing above U+10FFFF, no truncated sequence.
bool isValidUtf8(std::string_view bytes);

// Decodes stored or passed-through bytes: strict UTF-8 as it stands, otherwise
// Windows-1252 (the stand-in for the old system's "ANSI" code page) converted to UTF-8.
std::string decodeStoredText(std::string_view bytes);

// Windows-1252 bytes as UTF-8. The five bytes that code page leaves undefined map
// to the C1 controls of the same number.
std::string windows1252ToUtf8(std::string_view bytes);

// Latin-1 bytes as UTF-8: a narrow string "widened byte for byte".
std::string latin1ToUtf8(std::string_view bytes);
void appendLatin1AsUtf8(std::string& out, std::string_view bytes);

// The text up to (not including) its first NUL character.
std::string_view upToFirstNul(std::string_view s);

// Number of UTF-16 code units the (valid UTF-8) text takes.
std::size_t utf16Length(std::string_view utf8);

// The longest prefix of the (valid UTF-8) text that fits in maxUnits UTF-16 code
// units. A character is never split: one that would straddle the limit is dropped.
std::string_view truncateToUtf16Units(std::string_view utf8, std::size_t maxUnits);

// Comparison that ignores the case of the ASCII letters only (A-Z against a-z).
int compareIgnoringAsciiCase(std::string_view a, std::string_view b);
inline bool equalsIgnoringAsciiCase(std::string_view a, std::string_view b) {
    return a.size() == b.size() && compareIgnoringAsciiCase(a, b) == 0;
}

} // namespace OrvexKavorCore::text
