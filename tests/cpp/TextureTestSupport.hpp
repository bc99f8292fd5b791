#pragma once
// Helpers shared by the texture tests: hand-assembled byte images, records of
// objects, reading records back and XML of one object.
#include "archive/QuickArchive.hpp"
#include "xml/AssetXmlWriter.hpp"

#include <gtest/gtest.h>

#include <bit>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <vector>

namespace texturetest {

using ByteVector = std::vector<std::uint8_t>;
using OrvexKavorCore::QuickArchive;

// Little-endian byte images assembled by hand.
struct Image {
    ByteVector bytes;
    Image& u8(std::uint8_t v) {
        bytes.push_back(v);
        return *this;
    }
    Image& flag(bool v) { return u8(v ? 1 : 0); }
    Image& u32(std::uint32_t v) {
        for (int i = 0; i < 4; ++i) bytes.push_back(static_cast<std::uint8_t>(v >> (8 * i)));
        return *this;
    }
    Image& i32(std::int32_t v) { return u32(static_cast<std::uint32_t>(v)); }
    Image& version(std::uint16_t a, std::uint16_t b) { return u32(a | (std::uint32_t{b} << 16)); }
    Image& f32(std::initializer_list<float> vs) {
        for (float v : vs) u32(std::bit_cast<std::uint32_t>(v));
        return *this;
    }
    Image& text(std::string_view s) {
        u32(static_cast<std::uint32_t>(s.size()));
        bytes.insert(bytes.end(), s.begin(), s.end());
        return *this;
    }
    Image& append(const ByteVector& more) {
        bytes.insert(bytes.end(), more.begin(), more.end());
        return *this;
    }
    Image& identityTransform() { return f32({1, 0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0}); }
};

// The record an object writes; the write must succeed.
template <class Object>
ByteVector recordOf(Object& object) {
    QuickArchive ar;
    EXPECT_TRUE(object.writeToArchive(ar));
    ByteVector out(ar.writePosition());
    ar.getRaw(out.data(), out.size());
    return out;
}

// Reads a record into `object`; an accepted record must be consumed exactly.
// `keep` receives the archive (with its failure record).
template <class Object>
bool readInto(Object& object, const ByteVector& bytes, QuickArchive* keep = nullptr) {
    QuickArchive ar(bytes.data(), bytes.size());
    const bool ok = object.readFromArchive(ar);
    if (ok) {
        EXPECT_EQ(ar.readPosition(), bytes.size());
    }
    if (keep) *keep = ar;
    return ok;
}

// The reason recorded by a failed read, with its record path.
inline std::string failureOf(const QuickArchive& ar) { return ar.failure() ? ar.failure()->describe() : "(none)"; }

// The XML of one object written under `url`; the writer's depth returns to 0.
template <class Object>
std::string xmlOf(Object& object, const std::string& url) {
    std::string out;
    OrvexKavorCore::AssetXmlWriter writer(out);
    object.writeXml(writer, url);
    EXPECT_EQ(writer.depth(), 0u);
    return out;
}

} // namespace texturetest
