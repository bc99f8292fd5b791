#pragma once
// Helpers shared by the record tests: byte images assembled by hand, the record an
// object writes, reading records back, a check that every stored byte takes part in
// comparison, and golden documents.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/dexmor.hpp>
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <iterator>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace testsupport {

// The whole document of a conversion into a string (a library is read once).
inline std::string convertToXml(OrvexKavorCore::FileKind kind, const OrvexKavorCore::Input& input,
                                const OrvexKavorCore::ConversionOptions& options = {}) {
    std::string xml;
    OrvexKavorCore::StringSink sink(xml);
    OrvexKavorCore::convert(kind, input, sink, options);
    return xml;
}
inline std::string convertBytesToXml(OrvexKavorCore::FileKind kind, std::string_view bytes,
                                     const OrvexKavorCore::ConversionOptions& options = {}) {
    return convertToXml(kind, OrvexKavorCore::Input::ofBytes(bytes), options);
}
// The pieces a destination that cannot take back receives (a library is read twice).
inline std::vector<std::string> streamedPieces(OrvexKavorCore::FileKind kind, std::string_view bytes,
                                               const OrvexKavorCore::ConversionOptions& options = {}) {
    std::vector<std::string> pieces;
    OrvexKavorCore::CallbackSink sink([&pieces](std::string_view piece) { pieces.emplace_back(piece); });
    OrvexKavorCore::convert(kind, OrvexKavorCore::Input::ofBytes(bytes), sink, options);
    return pieces;
}
inline std::string streamedXml(OrvexKavorCore::FileKind kind, std::string_view bytes,
                               const OrvexKavorCore::ConversionOptions& options = {}) {
    std::string xml;
    for (const std::string& piece : streamedPieces(kind, bytes, options)) xml += piece;
    return xml;
}
// The bytes of a sample file in examples/.
inline std::string sample(const char* name) {
    std::ifstream in(std::string(DEXMOR_SOURCE_DIR) + "/examples/" + name, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}
inline OrvexKavorCore::Diagnosis diagnoseBytes(OrvexKavorCore::FileKind kind, std::string_view bytes) {
    return OrvexKavorCore::diagnose(kind, OrvexKavorCore::Input::ofBytes(bytes));
}

using ByteVector = std::vector<std::uint8_t>;
using OrvexKavorCore::QuickArchive;

// Little-endian byte images assembled by hand, independently of the archive's writers.
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
    Image& f64(double v) {
        const auto bits = std::bit_cast<std::uint64_t>(v);
        return u32(static_cast<std::uint32_t>(bits)).u32(static_cast<std::uint32_t>(bits >> 32));
    }
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

    // Values by type, as records store them.
    Image& put(float v) { return f32({v}); }
    Image& put(std::int32_t v) { return i32(v); }
    Image& put(std::uint32_t v) { return u32(v); }
    Image& put(bool v) { return flag(v); }
    Image& put(const std::string& s) { return text(s); }
    Image& put(const OrvexKavorCore::Vector& v) { return f32({v.x, v.y, v.z}); }
    Image& put(const OrvexKavorCore::Color& c) { return f32({c.r, c.g, c.b}); }
    Image& put(const OrvexKavorCore::Transform& t) { return put(t.m[0]).put(t.m[1]).put(t.m[2]).put(t.offs); }
    // A keyed transform's record: version, key count, time size, then time and value per key.
    Image& put(const OrvexKavorCore::AnimatedTransform& a) {
        version(0, 1).u32(static_cast<std::uint32_t>(a.keys().size())).u32(8);
        for (const auto& key : a.keys()) f64(key.time).put(key.value);
        return *this;
    }
};

// Everything written to an archive, wherever its read position stands.
inline ByteVector bytesOf(const QuickArchive& ar) {
    ByteVector out;
    for (const auto& chunk : ar.chunks()) out.insert(out.end(), chunk->begin(), chunk->end());
    out.resize(ar.writePosition());
    return out;
}

// The record an object writes; the write must succeed.
template <class Object>
ByteVector recordOf(Object& object) {
    QuickArchive ar;
    EXPECT_TRUE(object.writeToArchive(ar));
    return bytesOf(ar);
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
    // A document of its own: its sun assets are written anew.
    OrvexKavorCore::DocumentSunUrls suns;
    OrvexKavorCore::PerConversion<OrvexKavorCore::DocumentSunUrls>::Use document(suns);
    std::string out;
    OrvexKavorCore::AssetXmlWriter writer(out);
    object.writeXml(writer, url);
    EXPECT_EQ(writer.depth(), 0u);
    return out;
}

// The whole document of one object written under `path`.
template <class Object>
std::string documentOf(Object& object, const std::string& path = "") {
    std::string out;
    OrvexKavorCore::AssetXmlWriter writer(out);
    writer.beginDocument();
    object.writeXml(writer, path);
    writer.endDocument();
    EXPECT_EQ(writer.depth(), 0u);
    return out;
}

// Compares `actual` with the file tests/golden/`name`. With DEXMOR_UPDATE_GOLDEN=1
// in the environment the file is rewritten from `actual` first (review the
// difference before keeping it).
inline void expectGolden(const std::string& actual, const std::string& name) {
    const std::string path = std::string(DEXMOR_SOURCE_DIR) + "/tests/golden/" + name;
    if (std::getenv("DEXMOR_UPDATE_GOLDEN")) std::ofstream(path, std::ios::binary) << actual;
    std::ifstream in(path, std::ios::binary);
    ASSERT_TRUE(in) << path;
    const std::string expected{std::istreambuf_iterator<char>(in), {}};
    EXPECT_EQ(actual, expected) << name;
}

// The bytes of a sample file under examples/.
inline std::string sampleFile(const std::string& name) {
    std::ifstream in(std::string(DEXMOR_SOURCE_DIR) + "/examples/" + name, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

inline std::string textOf(const ByteVector& bytes) { return {bytes.begin(), bytes.end()}; }

// A new directory under the temporary directory, removed with its content.
class TempDir {
public:
    TempDir() {
        std::string pattern = (std::filesystem::temp_directory_path() / "dexmor-test-XXXXXX").string();
        if (!::mkdtemp(pattern.data())) ADD_FAILURE() << "cannot make " << pattern;
        path_ = pattern;
    }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;
    ~TempDir() {
        std::error_code ec;
        std::filesystem::remove_all(path_, ec);
    }
    // Writes `content` to the file `name` in the directory.
    std::filesystem::path file(const std::string& name, const std::string& content) const {
        const std::filesystem::path p = path_ / name;
        std::ofstream(p, std::ios::binary) << content;
        return p;
    }
    const std::filesystem::path& path() const { return path_; }

private:
    std::filesystem::path path_;
};

inline std::size_t occurrences(const std::string& text, const std::string& what) {
    std::size_t n = 0;
    for (auto at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++n;
    return n;
}

// Flips the lowest bit of every byte of `bytes` (of a record of `original`) outside
// [skipBegin, skipEnd) in turn. Where the changed record still reads completely
// into `make()`, the result must differ from `original`: no stored value is left
// out of the comparison. Returns the number of bytes compared so.
template <class Ptr, class Make>
std::size_t expectEveryStoredByteCompared(const Ptr& original, const ByteVector& bytes, Make make,
                                          std::size_t skipBegin = 0, std::size_t skipEnd = 0) {
    std::size_t compared = 0;
    for (std::size_t at = 0; at < bytes.size(); ++at) {
        if (at >= skipBegin && at < skipEnd) continue;
        ByteVector changed = bytes;
        changed[at] ^= 1;
        QuickArchive ar(changed.data(), changed.size());
        const auto read = make();
        if (!read->readFromArchive(ar) || ar.readPosition() != changed.size()) continue; // a flag, kind or version
        ++compared;
        EXPECT_FALSE(read->isEqual(original)) << "byte " << at;
        EXPECT_FALSE(original->isEqual(read)) << "byte " << at;
    }
    return compared;
}

// A 32-bit pattern that is not a NaN as a float (NaNs never compare equal); as the
// high half of a double it is no NaN either.
inline std::uint32_t randomWord(std::mt19937& rng) {
    for (;;)
        if (const std::uint32_t w = rng(); !std::isnan(std::bit_cast<float>(w))) return w;
}

// Non-empty UTF-8 mixing one- to four-byte characters and markup characters.
inline std::string randomText(std::mt19937& rng, unsigned maxPieces = 12) {
    static const char* const pieces[] = {"a", "Z", "7", " ", "\\", "&", "<", "\xC3\xA9", "\xE2\x82\xAC",
                                         "\xE6\x97\xA5", "\xF0\x9F\x8E\xAC"};
    std::string s;
    for (unsigned i = 0, n = 1 + rng() % maxPieces; i < n; ++i) s += pieces[rng() % std::size(pieces)];
    return s;
}

} // namespace testsupport
