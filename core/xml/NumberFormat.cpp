#include "xml/NumberFormat.hpp"

#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstring>

namespace OrvexKavorCore {

namespace {

constexpr int kPrecision = 6; // significant digits of the %g form

// Six significant digits (d.ddddd, trailing zeros dropped) and the decimal
// exponent of a positive number.
struct Decimal {
    char digits[kPrecision];
    int count = 0;
    int exponent = 0;
};

void dropTrailingZeros(Decimal& d) {
    while (d.count > 1 && d.digits[d.count - 1] == '0') --d.count;
}

// Ten to the powers 0 to 51, each the double nearest to it (exact up to 10^22).
constexpr double kPowersOfTen[] = {
    1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,  1e7,  1e8,  1e9,  1e10, 1e11, 1e12, 1e13, 1e14, 1e15, 1e16, 1e17,
    1e18, 1e19, 1e20, 1e21, 1e22, 1e23, 1e24, 1e25, 1e26, 1e27, 1e28, 1e29, 1e30, 1e31, 1e32, 1e33, 1e34, 1e35,
    1e36, 1e37, 1e38, 1e39, 1e40, 1e41, 1e42, 1e43, 1e44, 1e45, 1e46, 1e47, 1e48, 1e49, 1e50, 1e51};

// "00", "01", ... "99"
constexpr std::array<char, 200> kDigitPairs = [] {
    std::array<char, 200> pairs{};
    for (int i = 0; i < 100; ++i) {
        pairs[2 * i] = static_cast<char>('0' + i / 10);
        pairs[2 * i + 1] = static_cast<char>('0' + i % 10);
    }
    return pairs;
}();

// value * 10^power in one rounded operation on a rounded power: within 2.3e-16
// of the exact product, relatively.
double scaled(double value, int power) {
    return power >= 0 ? value * kPowersOfTen[power] : value / kPowersOfTen[-power];
}

// The six digits of the float's exact value rounded half away from zero, read
// from its full decimal expansion (a float has at most 112 significant digits):
// the seventh digit alone decides, as a 5 there means "at least halfway".
void exactSixDigits(float magnitude, Decimal& d) {
    char text[160];
    const char* end =
        std::to_chars(text, text + sizeof text, static_cast<double>(magnitude), std::chars_format::scientific, 120)
            .ptr;
    // "d.", 120 digits, "e+XX" or "e-XX"
    d.digits[0] = text[0];
    std::memcpy(d.digits + 1, text + 2, kPrecision - 1);
    d.count = kPrecision;
    const bool up = text[kPrecision + 1] >= '5';
    const char* e = text + 122;
    int exponent = 0;
    for (const char* p = e + 2; p != end; ++p) exponent = exponent * 10 + (*p - '0');
    d.exponent = e[1] == '-' ? -exponent : exponent;
    if (up) {
        int i = kPrecision - 1;
        while (i >= 0 && d.digits[i] == '9') d.digits[i--] = '0';
        if (i >= 0) {
            ++d.digits[i];
        } else { // 999999 and up: the next power of ten
            d.digits[0] = '1';
            ++d.exponent;
        }
    }
    dropTrailingZeros(d);
}

// The digits and exponent of %.6g for a finite, positive, non-zero float.
//
// The float's value v is scaled by a power of ten into [10^5, 10^6) in double
// arithmetic and rounded to an integer. The scaled value is within 2.3e-16 of
// exact, so within 2.3e-10 absolutely: its rounding is the rounding of the exact
// value unless its fraction lies within that distance of one half. Fractions
// within 1e-9 of a half (exact halves, and the rare values close to one) are
// decided from the exact decimal expansion instead.
void sixDigits(float magnitude, Decimal& d) {
    // floor(log2 v), then floor(log10 v) or one less: floor(log2 v * log10 2), where
    // 78913 / 2^18 is close enough to log10 2 to give that floor exactly for every
    // exponent a float can have.
    const auto bits = std::bit_cast<std::uint32_t>(magnitude);
    const int biased = static_cast<int>(bits >> 23);
    const int binaryExponent = biased != 0 ? biased - 127 : std::bit_width(bits) - 150;
    int exponent = (binaryExponent * 78913) >> 18;

    const double value = magnitude;
    double t = scaled(value, kPrecision - 1 - exponent);
    if (t >= 1e6) {
        ++exponent;
        t = scaled(value, kPrecision - 1 - exponent);
    }
    auto n = static_cast<std::int32_t>(t);
    const double fraction = t - n;
    if (std::fabs(fraction - 0.5) < 1e-9) {
        exactSixDigits(magnitude, d);
        return;
    }
    if (fraction > 0.5) ++n;
    if (n >= 1000000) { // rounded up into the next power of ten
        n = 100000;
        ++exponent;
    }
    auto rest = static_cast<std::uint32_t>(n);
    for (int i = kPrecision - 2; i >= 0; i -= 2) { // two digits at a time
        const std::uint32_t upper = rest / 100;
        std::memcpy(d.digits + i, kDigitPairs.data() + 2 * (rest - 100 * upper), 2);
        rest = upper;
    }
    d.count = kPrecision;
    d.exponent = exponent;
    dropTrailingZeros(d);
}

// Writes the %g text of the digits: fixed notation for exponents -4 to 5,
// otherwise one digit, the rest after the point, and an exponent of at least
// three digits.
char* compose(char* p, const Decimal& d) {
    const int x = d.exponent;
    if (x < -4 || x >= kPrecision) {
        *p++ = d.digits[0];
        if (d.count > 1) {
            *p++ = '.';
            std::memcpy(p, d.digits + 1, static_cast<std::size_t>(d.count - 1));
            p += d.count - 1;
        }
        *p++ = 'e';
        *p++ = x < 0 ? '-' : '+';
        const int ax = x < 0 ? -x : x; // below 100 for any float
        *p++ = static_cast<char>('0' + ax / 100);
        *p++ = static_cast<char>('0' + ax / 10 % 10);
        *p++ = static_cast<char>('0' + ax % 10);
    } else if (x >= 0) {
        const int whole = x + 1;
        for (int i = 0; i < whole; ++i) *p++ = i < d.count ? d.digits[i] : '0';
        if (d.count > whole) {
            *p++ = '.';
            std::memcpy(p, d.digits + whole, static_cast<std::size_t>(d.count - whole));
            p += d.count - whole;
        }
    } else {
        *p++ = '0';
        *p++ = '.';
        for (int i = -1; i > x; --i) *p++ = '0';
        std::memcpy(p, d.digits, static_cast<std::size_t>(d.count));
        p += d.count;
    }
    return p;
}

} // namespace

char* formatFloatTo(char* p, float value) {
    if (std::signbit(value)) *p++ = '-';
    if (std::isnan(value)) {
        std::memcpy(p, "nan", 3);
        return p + 3;
    }
    const float magnitude = std::fabs(value);
    if (std::isinf(magnitude)) {
        std::memcpy(p, "inf", 3);
        return p + 3;
    }
    // Whole numbers below 10^6 (the many 0s, 1s and 100s) are their own six-digit text.
    if (magnitude < 1e6f) {
        const auto whole = static_cast<std::int32_t>(magnitude);
        if (static_cast<float>(whole) == magnitude) return std::to_chars(p, p + 7, whole).ptr;
    }
    Decimal d;
    sixDigits(magnitude, d);
    return compose(p, d);
}

void appendFloat(std::string& out, float value) {
    char text[kMaxFloatChars];
    out.append(text, static_cast<std::size_t>(formatFloatTo(text, value) - text));
}

void appendInteger(std::string& out, std::int32_t value) {
    char text[16];
    const auto result = std::to_chars(text, text + sizeof text, value);
    out.append(text, static_cast<std::size_t>(result.ptr - text));
}

std::string formatFloat(float value) {
    std::string text;
    appendFloat(text, value);
    return text;
}

} // namespace OrvexKavorCore
