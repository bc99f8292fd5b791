// The blocks an options set owns: the renderer parameter block, the frame data and
// the frame-buffer stamp. Records are assembled here from their row numbers, so a
// field out of place in a record table shows up as a wrong value or wrong bytes.
#include "TrimSupport.hpp"

#include <dexmor/options/OrvexFrameData.hpp>
#include <dexmor/options/OrvexParams.hpp>
#include <dexmor/options/OrvexVFBStampInfo.hpp>

#include <algorithm>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// --- the parameter block's record, by row number ---

constexpr int kParamRows = 173;
constexpr std::array<int, 8> kTextRows = {69, 73, 89, 94, 104, 107, 122, 123};

bool isTextRow(int row) { return std::find(kTextRows.begin(), kTextRows.end(), row) != kTextRows.end(); }

// The first record version that holds the row.
int sinceOf(int row) {
    if (row >= 74 && row <= 77) return 5; // irradiance map detail
    if (row == 140) return 2;             // DMC path sampler type
    if (row == 144) return 3;             // subpixel mapping
    if (row == 145) return 4;             // colour-mapping gamma
    return 1;
}

// The stored values of one record: a 32-bit word per numeric row, a text per text row.
struct ParamValues {
    std::array<std::uint32_t, kParamRows + 1> words{};
    std::map<int, std::string> texts;

    float asFloat(int row) const { return std::bit_cast<float>(words[row]); }
    std::int32_t asInt(int row) const { return static_cast<std::int32_t>(words[row]); }
};

ParamValues randomParamValues(std::mt19937& rng) {
    ParamValues v;
    for (int row = 1; row <= kParamRows; ++row) {
        if (isTextRow(row)) v.texts[row] = randomText(rng);
        else v.words[row] = randomWord(rng);
    }
    return v;
}

// A record of `version` holding `v`, as the format lays it out.
QuickArchive assembleParams(const ParamValues& v, std::uint16_t version) {
    QuickArchive ar;
    ar.write(VersionWord::make(0, version));
    for (int row = 1; row <= kParamRows; ++row) {
        if (row == 74 && version < 5) ar.write(-12345.5f); // read and dropped
        if (sinceOf(row) > version) continue;
        if (isTextRow(row)) {
            auto it = v.texts.find(row);
            ar.writeWString(it == v.texts.end() ? std::string() : it->second);
        } else {
            ar.write(v.words[row]);
        }
    }
    return ar;
}

OrvexParams readParams(QuickArchive ar) {
    OrvexParams p;
    EXPECT_TRUE(p.readFromArchive(ar));
    EXPECT_EQ(ar.readPosition(), ar.writePosition()); // the whole record, no more
    return p;
}

void setUnstoredFields(KavorUtils::KavorParams& p) {
    p.imageSampler.subdivision_show_samples = 1, p.irradianceMap.interp_frames = 9, p.irradianceMap.multiple_views = 1;
    p.photonMap.show_calc_phase = 1, p.lightCache.adaptive_dirs_only = 1, p.lightCache.min_paths_per_sample = 3;
    p.lightCache.multiple_views = 1, p.caustics.show_calc_phase = 1, p.raycaster.optLevel = 4;
    p.colorMapping.adaptation_only = 1, p.colorMapping.clamp_level = 0.25f, p.colorMapping.linearWorkflow = 1;
    p.options.geom_doHidden = 0, p.options.mtl_filterMapsForSecondaryRays = 1, p.options.geom_backfaceCull = 1;
}

} // namespace

TEST(ParamsBlock, RandomRecordsReadAndWriteBackByteForByte) {
    std::mt19937 rng(20240611);
    for (int round = 0; round < 20; ++round) {
        const ParamValues v = randomParamValues(rng);
        QuickArchive stored = assembleParams(v, 5);
        const OrvexParams p = readParams(stored);

        // Values land in the fields their rows name.
        EXPECT_EQ(std::tuple(p.imageFilter.on, p.imageSampler.aux3, p.gi.primary_engine, p.irradianceMap.str1),
                  std::tuple(v.asInt(1), v.asFloat(16), v.words[45], v.texts.at(69)));
        EXPECT_EQ(std::tuple(p.irradianceMap.detail_radius, p.photonMap.auto_search_distance, p.lightCache.str2),
                  std::tuple(v.asFloat(75), v.asInt(85), v.texts.at(107)));
        EXPECT_EQ(std::tuple(p.caustics.search_distance, p.caustics.str2, p.dmcSampler.path_sampler_type),
                  std::tuple(v.asFloat(115), v.texts.at(123), v.asInt(140)));
        EXPECT_EQ(std::tuple(p.colorMapping.gamma, p.options.misc_lowThreadPriority, p.defaultDisplacement.aux2),
                  std::tuple(v.asFloat(145), v.asInt(164), v.asInt(173)));

        OrvexParams copy = p;
        ASSERT_EQ(recordOf(copy), bytesOf(stored));
        OrvexParams back = readParams(stored);
        EXPECT_TRUE(back.isEqual(p) && back.isIdentical(p)) << differenceOf(back, p);
    }
}

TEST(ParamsBlock, OlderVersionsKeepDefaultsForTheFieldsTheyLack) {
    std::mt19937 rng(7);
    const ParamValues v = randomParamValues(rng);
    const OrvexParams newest = readParams(assembleParams(v, 5));

    for (std::uint16_t version = 1; version <= 4; ++version) {
        SCOPED_TRACE(version);
        const OrvexParams old = readParams(assembleParams(v, version));

        // Version 4's dropped Float32 stands where the four detail fields are.
        EXPECT_EQ(old.irradianceMap.detail_enhancement, 0);
        EXPECT_EQ(old.irradianceMap.detail_radius, 60.0f);
        EXPECT_EQ(old.irradianceMap.detail_subdivs_mult, 0.3f);
        EXPECT_EQ(old.irradianceMap.detail_scale, 0u);
        EXPECT_EQ(old.dmcSampler.path_sampler_type, version >= 2 ? v.asInt(140) : 2);
        EXPECT_EQ(old.colorMapping.subpixel_mapping, version >= 3 ? v.asInt(144) : 0);
        EXPECT_EQ(old.colorMapping.gamma, version >= 4 ? v.asFloat(145) : 1.0f);

        // Every other field as in the newest record.
        OrvexParams expected = newest;
        expected.irradianceMap.detail_enhancement = old.irradianceMap.detail_enhancement;
        expected.irradianceMap.detail_radius = old.irradianceMap.detail_radius;
        expected.irradianceMap.detail_subdivs_mult = old.irradianceMap.detail_subdivs_mult;
        expected.irradianceMap.detail_scale = old.irradianceMap.detail_scale;
        expected.dmcSampler.path_sampler_type = old.dmcSampler.path_sampler_type;
        expected.colorMapping.subpixel_mapping = old.colorMapping.subpixel_mapping;
        expected.colorMapping.gamma = old.colorMapping.gamma;
        EXPECT_TRUE(old.isIdentical(expected)) << differenceOf(old, expected);
    }
}

TEST(ParamsBlock, FieldsTheRecordDoesNotHoldAlwaysReadBackAsDefaults) {
    OrvexParams plain;
    plain.gi.on = 1;
    OrvexParams source = plain, target;
    setUnstoredFields(source);
    const ByteVector bytes = recordOf(source);
    EXPECT_EQ(bytes, recordOf(plain));
    EXPECT_TRUE(source.isEqual(plain)); // equal in everything the record holds
    EXPECT_FALSE(source.isIdentical(plain));
    setUnstoredFields(target); // set before reading, reset by it
    ASSERT_TRUE(readInto(target, bytes));
    EXPECT_TRUE(target.isIdentical(plain));
}

TEST(ParamsBlock, TextFields) {
    // No text is written as the empty WString (a zero count) and reads back as no text.
    OrvexParams none, back;
    const ByteVector bytes = recordOf(none);
    ASSERT_EQ(bytes.size(), 4u + 4u * kParamRows); // every row four bytes
    for (int row : kTextRows) EXPECT_EQ(withWord(bytes, 4 * row, 0), bytes) << "row " << row;
    back.lightCache.str1 = "something";
    ASSERT_TRUE(readInto(back, bytes));
    EXPECT_EQ(back.lightCache.str1, "");

    // Within the record, an empty stored text leaves the field as it was; a
    // non-empty one replaces it.
    ParamValues v;
    v.texts[104] = "\xE2\x82\xAC cache";
    QuickArchive stored = assembleParams(v, 5);
    stored.skip(4); // the version word
    KavorUtils::KavorParams fields;
    fields.irradianceMap.str1 = "kept";
    fields.lightCache.str1 = "replaced";
    ASSERT_TRUE(record::readFields(stored, fields, OrvexParams::recordFields(), 5));
    EXPECT_EQ(fields.irradianceMap.str1, "kept");
    EXPECT_EQ(fields.lightCache.str1, "\xE2\x82\xAC cache");

    // (A text whose count runs past the data: HostileInputTest.)
}

TEST(ParamsBlock, OptionsSetOverridesAndNoAssetOfItsOwn) {
    OrvexParams p, expected;
    p.lightCache.str1 = "a", p.lightCache.str2 = "b", p.lightCache.adaptive_sampling = 1;
    p.applyOptionsSetOverrides();
    expected.imageFilter.on = 1, expected.imageSampler.type = 2, expected.options.mtl_limitDepth = 1;
    expected.caustics.search_distance = 20.0f; // the block's own default is 1e18
    EXPECT_TRUE(p.isIdentical(expected)) << differenceOf(p, expected);

    EXPECT_EQ(xmlOf(p, "/x"), "");
}

// --- frame data ---

namespace {

constexpr std::size_t kFrameDataBytes = 4 + 3 * 8 + 4 + 2 * 48 + 17 * 4 + 6 * 12 + 18 * 4;

} // namespace

TEST(FrameData, RandomRecordsReadAndWriteBackByteForByte) {
    std::mt19937 rng(4711);
    for (int round = 0; round < 20; ++round) {
        // Three Float64, then 78 four-byte values (the transforms and colours are floats).
        QuickArchive stored;
        stored.write(VersionWord::make(0, 1));
        std::array<double, 3> times{};
        for (double& d : times) stored.write(d = std::bit_cast<double>(std::uint64_t{randomWord(rng)} << 32 | rng()));
        std::array<std::uint32_t, 78> words{};
        for (std::uint32_t& w : words) stored.write(w = randomWord(rng));
        ASSERT_EQ(stored.writePosition(), kFrameDataBytes);
        const auto f = [&](std::size_t i) { return std::bit_cast<float>(words[i]); };
        const auto n = [&](std::size_t i) { return static_cast<std::int32_t>(words[i]); };

        OrvexFrameData fd;
        ASSERT_TRUE(fd.readFromArchive(stored));
        EXPECT_EQ(std::tuple(fd.t, fd.frameEnd, fd.currentFrame), std::tuple(times[0], times[2], n(0)));
        EXPECT_EQ(fd.worldToCam, (Transform{{{{f(1), f(2), f(3)}, {f(4), f(5), f(6)}, {f(7), f(8), f(9)}}},
                                            {f(10), f(11), f(12)}}));
        EXPECT_EQ(std::tuple(fd.camToWorld.m[0].x, fd.camToWorld.offs.z, fd.fov, fd.orthoAdjustToScene),
                  std::tuple(f(13), f(24), f(25), n(41)));
        EXPECT_EQ(std::tuple(fd.ambient, fd.background.r, fd.globalLightLevel.r, fd.kavorGIBackground.r),
                  std::tuple(Color{f(42), f(43), f(44)}, f(45), f(48), f(51)));
        EXPECT_EQ(std::tuple(fd.kavorRRBackground.r, fd.kavorRefractBackground, fd.rgn_left),
                  std::tuple(f(54), Color{f(57), f(58), f(59)}, f(60)));
        EXPECT_EQ(std::tuple(fd.r_height, fd.firstField, fd.bright_mult), std::tuple(n(71), n(75), f(77)));

        ASSERT_EQ(recordOf(fd), bytesOf(stored));
        EXPECT_TRUE(fd.isEqual(OrvexFrameData(fd)));
    }
}

TEST(FrameData, OwnAssetGolden) {
    OrvexFrameData fd;
    fd.t = 1.5, fd.frameEnd = 250.0, fd.currentFrame = -3;
    fd.worldToCam = Transform{Matrix::identity(), Vector{1, 2, 3}};
    fd.camToWorld = Transform{Matrix{{{0, 0, -1}, {0, 1, 0}, {1, 0, 0}}}, Vector{-1e6f, 0.5f, 2.5e-7f}};
    fd.fov = 0.785398f, fd.clippingPlanes = 1, fd.clipFar = 1000.0f, fd.fieldMask = 2;
    fd.ambient = Color{0.1f, 0.2f, 0.3f}, fd.kavorRefractBackground = Color{1, 0.5f, 0};
    fd.focal_dist = 123.0f; // shown by the options set's sections, not here

    expectGolden(xmlOf(fd, "/scene"), "frame_data.xml");
}

// --- stamp info ---

namespace {

ByteVector counting(std::size_t n, std::uint8_t first = 1) {
    ByteVector bytes(n);
    for (std::size_t i = 0; i < n; ++i) bytes[i] = static_cast<std::uint8_t>(first + i);
    return bytes;
}
std::array<std::uint8_t, 60> blockOf(const ByteVector& bytes) {
    std::array<std::uint8_t, 60> block{};
    std::copy_n(bytes.begin(), std::min<std::size_t>(60, bytes.size()), block.begin());
    return block;
}
// A stamp record up to its block: version word, the three integers and the text.
Image stampHead(std::uint16_t version, const std::string& text, std::int32_t i1 = 1, std::int32_t i3 = 3) {
    return Image{}.version(0, version).i32(i1).i32(2).i32(i3).text(text);
}

} // namespace

TEST(StampInfo, NonAsciiTextAndBlockRoundTrip) {
    OrvexVFBStampInfo stamp;
    stamp.si_i1 = -1, stamp.si_i2 = 2, stamp.si_i3 = 70000;
    stamp.text = "Rendu \xC3\xA0 %rendertime \xE2\x80\x94 \xE6\x97\xA5\xE6\x9C\xAC \xF0\x9F\x8E\xAC";
    stamp.si_block = blockOf(counting(60, 200));
    const ByteVector bytes = recordOf(stamp);
    EXPECT_EQ(bytes, stampHead(2, stamp.text, -1, 70000).u32(60).append(counting(60, 200)).bytes);
    OrvexVFBStampInfo back;
    ASSERT_TRUE(readInto(back, bytes));
    EXPECT_TRUE(back.isEqual(stamp));
}

// Version 1 stores the block without a count; version 2 with one, of which 60
// bytes are kept (the rest zero), a surplus skipped, and a count beyond the data fails.
TEST(StampInfo, StoredBlocks) {
    const struct {
        ByteVector bytes;
        ByteVector kept;
    } cases[] = {
        {stampHead(1, "").append(counting(60)).bytes, counting(60)}, // an empty stored text replaces the default
        {stampHead(2, "x").u32(64).append(counting(64)).bytes, counting(60)},
        {stampHead(2, "x").u32(10).append(counting(10)).bytes, counting(10)},
        {stampHead(2, "x").u32(0x7FFFFFFF).bytes, {}},
    };
    for (const auto& c : cases) {
        OrvexVFBStampInfo stamp, expected;
        stamp.si_block = blockOf(counting(60, 100));
        QuickArchive ar;
        EXPECT_EQ(readInto(stamp, c.bytes, &ar), !c.kept.empty()) << failureOf(ar);
        if (c.kept.empty()) continue;
        expected.si_i1 = 1, expected.si_i2 = 2, expected.si_i3 = 3;
        expected.text = c.bytes[2] == 1 ? "" : "x";
        expected.si_block = blockOf(c.kept);
        EXPECT_TRUE(stamp.isEqual(expected));
    }
}

// --- all three blocks ---

namespace {
bool atDefaults(const OrvexParams& p) { return p.isIdentical(OrvexParams{}); }
template <class Block>
bool atDefaults(const Block& b) {
    return b.isEqual(Block{});
}

// Reads `bytes` into `block` (holding other values), which must refuse them for
// `reason` and be left at its defaults.
template <class Block>
void expectRefused(Block block, const ByteVector& bytes, const std::string& reason) {
    expectReadFails(block, bytes, reason + " at offset 4");
    EXPECT_TRUE(atDefaults(block)) << reason;
}
} // namespace

TEST(OptionsBlocks, UnknownVersionsAreRejectedAndLeaveTheDefaults) {
    std::mt19937 rng(11);
    const ParamValues v = randomParamValues(rng);
    OrvexFrameData frame;
    frame.fov = 1.0f;
    OrvexVFBStampInfo stamp;
    stamp.text = "changed";
    using Word = std::pair<std::uint16_t, std::uint16_t>;
    for (const auto& [first, second] : {Word{0, 0}, Word{0, 6}, Word{1, 5}, Word{0, 2}, Word{0, 3}}) {
        const std::string word = "(" + std::to_string(first) + ", " + std::to_string(second) + ")";
        const ByteVector bytes = withVersion(bytesOf(assembleParams(v, 5)), first, second);
        if (second != 2 && second != 3)
            expectRefused(readParams(assembleParams(v, 5)), bytes, "unknown parameter block version " + word);
        if (second != 1) expectRefused(frame, bytes, "unknown frame data version " + word);
        if (second != 1 && second != 2) expectRefused(stamp, bytes, "unknown stamp info version " + word);
    }
}
