#pragma once
// Checks that most record tests share: a whole round trip of an object and its copy,
// a read that must fail for a given reason, a record with one word replaced, and a
// record assembled field by field with the object it reads to. Also the headers
// every record test uses.
#include "TestSupport.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <cstdint>
#include <cstring>
#include <functional>
#include <limits>
#include <map>
#include <random>
#include <sstream>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

namespace testsupport {

// `original` writes a record that reads into `make()` as an equal object writing the
// same bytes; its copy is another object, equal to it and writing the same bytes.
// `sameCopy` may make the copy comparable first (a sky's copy has its own identifier).
template <class Ptr, class Make, class SameCopy>
ByteVector expectRoundTrip(const Ptr& original, Make make, SameCopy sameCopy) {
    const ByteVector bytes = recordOf(*original);
    const auto read = make();
    QuickArchive ar;
    EXPECT_TRUE(readInto(*read, bytes, &ar)) << failureOf(ar);
    EXPECT_TRUE(read->isEqual(original));
    EXPECT_TRUE(original->isEqual(read));
    EXPECT_EQ(recordOf(*read), bytes);
    const auto copy = original->clone();
    EXPECT_TRUE(copy && copy != original);
    if (!copy) return bytes;
    sameCopy(*copy);
    EXPECT_TRUE(copy->isEqual(original));
    EXPECT_EQ(recordOf(*copy), bytes);
    return bytes;
}
template <class Ptr, class Make>
ByteVector expectRoundTrip(const Ptr& original, Make make) {
    return expectRoundTrip(original, make, [](auto&) {});
}

// Reading `bytes` into `object` fails, and the failure's description contains `reason`.
template <class Object>
void expectReadFails(Object& object, const ByteVector& bytes, std::string_view reason) {
    QuickArchive ar;
    EXPECT_FALSE(readInto(object, bytes, &ar)) << reason;
    EXPECT_NE(failureOf(ar).find(reason), std::string::npos) << failureOf(ar);
}

// `bytes` with the 32-bit word at `at` replaced.
inline ByteVector withWord(ByteVector bytes, std::size_t at, std::uint32_t value) {
    std::memcpy(bytes.data() + at, &value, 4);
    return bytes;
}
inline ByteVector withVersion(ByteVector bytes, std::uint16_t first, std::uint16_t second, std::size_t at = 0) {
    return withWord(std::move(bytes), at, first | std::uint32_t{second} << 16);
}

// For failure messages: the first stored field in which `a` and `b` differ.
template <class Block>
std::string differenceOf(const Block& a, const Block& b) {
    const char* name = a.firstDifference(b);
    return name ? name : "no stored field";
}

// A record assembled by hand and the object it reads to: the defaults with the
// values the record holds. Each call names a field and its stored type; numbers
// take the next of 1, 2, 3 ..., so that a value read into another field, or a
// field read from another place, shows.
template <class T>
struct Assembled {
    Image image;
    T object;
    float next = 0;
    explicit Assembled(int version) { image.version(0, static_cast<std::uint16_t>(version)); }

    template <class V>
    Assembled& put(V T::*field, const V& value) {
        object.*field = value;
        image.put(value);
        return *this;
    }
    Assembled& c(OrvexKavorCore::Color T::*m) { return put(m, {next + 1, next + 2, next + 3}), next += 3, *this; }
    Assembled& v(OrvexKavorCore::Vector T::*m) { return put(m, {next + 1, next + 2, next + 3}), next += 3, *this; }
    Assembled& f(float T::*m) { return put(m, ++next); }
    Assembled& i(std::int32_t T::*m) { return put(m, static_cast<std::int32_t>(++next)); }
    Assembled& u(std::uint32_t T::*m) { return put(m, static_cast<std::uint32_t>(++next)); }
    Assembled& b(bool T::*m, bool value) { return put(m, value); }
    // A keyed value stored as its plain value, read as the value at time 0.
    template <class K, class V>
    Assembled& plain(K T::*m, const V& value) {
        image.put(value);
        (object.*m).setValue(value, 0.0);
        return *this;
    }
};

} // namespace testsupport
