#pragma once
// Numbers as the XML document writes them.
//
// Floats follow C's %g with six significant digits, as the documents' consumers
// have always received them: the shorter of fixed and exponential notation,
// trailing zeros dropped, the exponent with a sign and at least three digits
// ("1e+006", "2.5e-007"). A value exactly halfway between two six-digit results
// rounds away from zero (0.0009765625 gives "0.000976563"). Infinities and NaNs
// print as "inf", "-inf", "nan", "-nan".
#include <cstdint>
#include <string>

namespace OrvexKavorCore {

// The longest text of a float ("-1.23456e-038").
inline constexpr int kMaxFloatChars = 16;

// Writes the float's text at `first`, which has room for kMaxFloatChars
// characters, and returns the end of the text.
char* formatFloatTo(char* first, float value);

// Appends the float's text; no heap allocation beyond growing `out`.
void appendFloat(std::string& out, float value);
void appendInteger(std::string& out, std::int32_t value);

std::string formatFloat(float value);

} // namespace OrvexKavorCore
