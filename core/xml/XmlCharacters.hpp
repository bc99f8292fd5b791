#pragma once
// Characters XML 1.0 cannot carry, not even as character references: the C0
// controls other than tab, line feed and carriage return, U+FFFE and U+FFFF, and
// any byte that does not belong to a well-formed UTF-8 sequence. The plain
// document keeps such characters as the file gave them; the wrapped form writes
// U+FFFD in their place, so that any XML tool reads it.
#include <cstddef>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// Whether `text` holds a character XML 1.0 cannot carry.
bool holdsCharacterXmlCannotCarry(std::string_view text);

// Turns the writer's text into the wrapped form's, piece by piece:
//   - U+FFFD for each character XML 1.0 cannot carry (one for each maximal
//     ill-formed UTF-8 subpart);
//   - tab, line feed and carriage return inside attribute values as character
//     references (a parser would read them as spaces), and a carriage return in
//     element text as one (a parser would read it as a line feed), so that a url
//     and a reference to it still read alike.
// It follows the markup as it goes (inside a tag, inside a quoted value), which
// the writer's text allows: it escapes "<" and "&" in every text, and '"' in
// every attribute value.
class XmlCarrier {
public:
    // Appends the wrapped form of `text`, the next piece of the document, to
    // `out`. When `complete` is false, a character cut at the piece's end is left
    // for the next piece: the result is how many bytes were left (at most 3).
    std::size_t append(std::string& out, std::string_view text, bool complete);

private:
    bool inTag_ = false;
    bool inValue_ = false;
};

} // namespace OrvexKavorCore
