// Numbers as the XML document writes them: %g with six significant digits, a
// three-digit exponent, exact halves rounded away from zero.
#include "xml/NumberFormat.hpp"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <limits>
#include <string>
#include <utility>
#include <vector>

using namespace OrvexKavorCore;

TEST(NumberFormat, Floats) {
    using limits = std::numeric_limits<float>;
    // (Finite values, halfway cases among them: the comparison with the C library below.)
    const std::vector<std::pair<float, const char*>> cases = {
        {0.0f, "0"}, {-0.0f, "-0"}, {1e6f, "1e+006"}, {2.5e-7f, "2.5e-007"}, {limits::max(), "3.40282e+038"},
        {limits::denorm_min(), "1.4013e-045"}, // six digits of a subnormal's exact value
        // Exactly halfway between two six-digit results: away from zero.
        {1234.125f, "1234.13"}, {-123456.5f, "-123457"}, {999999.5f, "1e+006"},
        // Not halfway, although the shortest text of the float ends in a 5.
        {1.000005f, "1.00001"}, {1.000045f, "1.00004"},
        {limits::infinity(), "inf"}, {-limits::infinity(), "-inf"}, {limits::quiet_NaN(), "nan"},
        {-limits::quiet_NaN(), "-nan"}, {std::bit_cast<float>(0xFFC00001u), "-nan"},
    };
    for (const auto& [value, text] : cases) EXPECT_EQ(formatFloat(value), text) << value;
    // (Appending to a document, and the integers: the XML writer's golden documents.)
}

namespace {

// An independent oracle, the C library: it rounds exact halves to even, so an
// exact half (seen in the full expansion: seven digits, the last a 5) is
// printed from the next double away from zero.
std::string expectedText(float value) {
    double d = value;
    char text[256];
    std::snprintf(text, sizeof text, "%.6e", std::fabs(d));
    bool half = text[7] == '5';
    if (half) std::snprintf(text, sizeof text, "%.150e", std::fabs(d));
    for (int i = 8; half && text[i] != 'e'; ++i) half = text[i] == '0';
    if (half) d = std::nextafter(d, std::copysign(INFINITY, d));
    std::snprintf(text, sizeof text, "%.6g", d);
    std::string s = text;
    const auto e = s.find('e');
    if (e != std::string::npos && s.size() - e - 2 < 3) s.insert(e + 2, 3 - (s.size() - e - 2), '0');
    return s;
}

} // namespace

TEST(NumberFormat, AgreesWithTheCLibraryOnSampledFloats) {
    // Bit patterns spread over every exponent and both signs, the floats around
    // values that lie exactly halfway, and whole numbers on both sides of 10^6.
    std::vector<float> values;
    for (std::uint64_t bits = 0; bits < 0x100000000ull; bits += 65521)
        values.push_back(std::bit_cast<float>(static_cast<std::uint32_t>(bits)));
    for (float centre : {1.015625f, 1234.125f, 123456.5f, 0.0009765625f, 3.0517578e-5f, 8388607.5f, 999999.5f}) {
        float f = centre;
        for (int i = 0; i < 1000; ++i) f = std::nextafter(f, 0.0f);
        for (int i = 0; i < 2000; ++i, f = std::nextafter(f, INFINITY)) values.push_back(f);
    }
    for (int whole = -1'100'000; whole <= 1'100'000; whole += 97) values.push_back(static_cast<float>(whole));
    int mismatches = 0;
    for (float value : values) {
        if (!std::isfinite(value)) continue;
        const std::string text = formatFloat(value), expected = expectedText(value);
        if (text != expected && ++mismatches <= 10) ADD_FAILURE() << value << ": " << text << " vs " << expected;
    }
    EXPECT_EQ(mismatches, 0);
}
