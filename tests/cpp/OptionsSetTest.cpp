// The options set's record: every accepted version, the rejected ones, failing
// members, the channel list and file name rules, and the conversion of an options
// file. Records are assembled here from the format's row list (row, first version
// holding it), written out independently of the record table in the code, so that
// a row out of place or with a wrong first version shows up as wrong bytes.
#include "TrimSupport.hpp"

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/textures/SkyTexture.hpp>

#include <span>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Every plain numeric row of a record table gets random bits: the row is read back
// from random bytes of its own stored size. Rows that do not read from random
// bytes (texts, lists, sub-records, keyed values) keep their value.
template <class Obj>
void randomiseNumbers(Obj& object, std::span<const record::Field<Obj>> fields, unsigned version, std::mt19937& rng) {
    for (const auto& f : fields) {
        if (!f.versions.holds(version)) continue;
        QuickArchive current;
        f.write(current, object);
        const auto before = bytesOf(current);
        if (before.size() % 4 != 0) continue;
        std::vector<std::uint32_t> words(before.size() / 4);
        for (auto& w : words) w = randomWord(rng);
        QuickArchive random(words.data(), before.size());
        if (f.read(random, object) && !random.failed() && random.readPosition() == before.size()) continue;
        QuickArchive restore(before.data(), before.size());
        f.read(restore, object);
    }
}

AllOptions randomOptions(std::mt19937& rng) {
    AllOptions o;
    randomiseNumbers<KavorUtils::KavorParams>(o.params, OrvexParams::recordFields(), OrvexParams::kVersion, rng);
    o.params.irradianceMap.str1 = randomText(rng);
    o.params.lightCache.str2 = randomText(rng);
    randomiseNumbers<KavorUtils::KavorFrameData>(o.frameData, OrvexFrameData::recordFields(), 1, rng);
    o.stampInfo.si_i2 = static_cast<std::int32_t>(rng());
    o.stampInfo.text = randomText(rng);
    o.stampInfo.si_block[7] = 0xA5;
    randomiseNumbers<PhysicalCamera>(o.camera, PhysicalCamera::recordFields(), PhysicalCamera::kVersion, rng);
    o.camera.focal_length.setValue(35.0f, 12.5);
    o.camera.focus_distance.setInterpolate(false);
    o.camera.focus_distance.setValue(2.0f, -3.0);
    randomiseNumbers<AllOptions>(o, AllOptions::recordFields(), AllOptions::kVersion, rng);

    o.bg_tex = createTexture(BaseTexture::kChecker);
    o.gi_tex = (rng() % 2) ? createTexture(BaseTexture::kSky) : TexturePtr();
    o.refract_tex = createTexture(BaseTexture::kFresnel);
    o.channels.clear();
    for (unsigned i = 0, n = rng() % 8; i < n; ++i) o.channels.push_back(100 + rng() % 33);
    for (std::string* name : {&o.img_file, &o.kvimg_file, &o.im_file, &o.im_auto_save_file, &o.lc_file,
                              &o.lc_auto_save_file, &o.pm_file, &o.pm_auto_save_file, &o.caustics_file,
                              &o.caustics_auto_save_file, &o.aux_text})
        *name = randomText(rng);
    return o;
}

// --- the record as the format lays it out ---

void put(QuickArchive& ar, std::int32_t v) { ar.write(v); }
void put(QuickArchive& ar, float v) { ar.write(v); }
void put(QuickArchive& ar, const Color& v) { ar.write(v); }
void put(QuickArchive& ar, const std::string& text) { ar.writeWString(text); }
void put(QuickArchive& ar, const std::vector<std::uint32_t>& ids) {
    ar.write(static_cast<std::uint32_t>(ids.size()));
    for (std::uint32_t id : ids) ar.write(id);
}
void put(QuickArchive& ar, const TexturePtr& texture) {
    ar.write(static_cast<bool>(texture));
    if (!texture) return;
    ar.write(texture->kindId());
    ASSERT_TRUE(texture->writeToArchive(ar));
}
template <class Block>
auto put(QuickArchive& ar, Block& block) -> decltype(block.writeToArchive(ar), void()) {
    ASSERT_TRUE(block.writeToArchive(ar));
}

// One row: its field, the first version holding it, how it is written, and how a
// reader takes it over.
struct Row {
    const char* field;
    unsigned since;
    void (*put)(QuickArchive&, AllOptions&);
    void (*copy)(const AllOptions& from, AllOptions& to);
};

#define R(since, f)                                                                                                   \
    Row {                                                                                                             \
        #f, since, [](QuickArchive& ar, AllOptions& o) { put(ar, o.f); },                                             \
            [](const AllOptions& from, AllOptions& to) { to.f = from.f; }                                             \
    }

// Rows 2 to 73 (row 1 is the version word).
const Row kRows[] = {
    R(0, params), R(0, frameData), R(0, stampInfo), R(5, camera), R(0, bg_tex), R(0, gi_tex), R(0, bg_color),
    R(0, gi_color), R(0, use_gi), R(0, use_bg), R(0, filter_kind), R(0, img_height), R(0, img_width),
    R(0, override_fov), R(0, override_viewport), R(0, aux_i2), R(0, aux_i1), R(0, img_rawFile), R(0, save_render),
    R(2, inverse_override_focal_dist), R(3, aux_i4), R(5, physical_on), R(6, override_focal_length), R(0, fov),
    R(0, gi_mult), R(0, bg_mult), R(0, gi_tex_mult), R(0, bg_tex_mult), R(0, filter_size), R(0, img_pixelAspect),
    R(0, aux_f3), R(4, zdepth_black), R(4, zdepth_white), R(4, zdepth_clamp), R(0, channels), R(0, img_file),
    R(0, kvimg_file), R(0, im_file), R(0, im_auto_save_file), R(0, lc_file), R(0, lc_auto_save_file), R(0, pm_file),
    R(0, pm_auto_save_file), R(0, caustics_file), R(0, caustics_auto_save_file), R(1, aux_color), R(1, aux_i3),
    R(7, gamma_correct_rgb), R(7, gamma_correct_ldr_textures), R(8, do_animation), R(8, frame_rate),
    R(8, frames_per_second), R(9, reflect_color), R(9, refract_color), R(9, reflect_mult), R(9, refract_mult),
    R(9, reflect_tex_mult), R(9, refract_tex_mult), R(9, use_reflect), R(9, use_refract), R(9, reflect_tex),
    R(9, refract_tex), R(16, aux_i5), R(17, aux_f1), R(17, aux_f2), R(18, input_gamma), R(19, aux_i8), R(20, aux_i6),
    R(20, aux_i7), R(20, aux_text), R(22, aux_i9), R(23, specify_film_width),
};
#undef R
static_assert(std::size(kRows) == 72);

constexpr unsigned kAcceptedVersions[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 16, 17, 18, 19, 20, 21, 22, 23};

// The record of `version` holding `o`, under the version word `word`; with
// `stopAt`, only the rows before that field.
QuickArchive assemble(AllOptions& o, unsigned version, VersionWord word, const char* stopAt = nullptr) {
    QuickArchive ar;
    ar.write(word);
    for (const Row& row : kRows) {
        if (stopAt && std::string(row.field) == stopAt) break;
        if (row.since <= version) row.put(ar, o);
    }
    return ar;
}
QuickArchive assemble(AllOptions& o, unsigned version) {
    return assemble(o, version, VersionWord::make(1, static_cast<std::uint16_t>(version)));
}

// Reads a record that must be accepted and consumed exactly.
void readWhole(AllOptions& o, QuickArchive ar) {
    ASSERT_TRUE(o.readFromArchive(ar)) << (ar.failure() ? ar.failure()->describe() : "");
    EXPECT_EQ(ar.readPosition(), ar.writePosition());
}

} // namespace

TEST(AllOptions, RandomSetsRoundTripAtVersion23) {
    std::mt19937 rng(230023);
    for (int round = 0; round < 6; ++round) {
        const ConversionContext fresh1;
        AllOptions source = randomOptions(rng), back;
        const ByteVector bytes = recordOf(source);
        ASSERT_EQ(bytes, bytesOf(assemble(source, 23)));
        ASSERT_TRUE(readInto(back, bytes));
        EXPECT_TRUE(back.isEqual(source)) << differenceOf(back, source);
        EXPECT_EQ(back.camera.focal_length.keyCount(), 2);
        EXPECT_EQ(recordOf(back), bytes);
    }
}

TEST(AllOptions, OlderRecordsReadWithDefaultsForTheRowsTheyLack) {
    std::mt19937 rng(1999);
    AllOptions source = randomOptions(rng);
    source.reflect_tex = createTexture(BaseTexture::kChecker);
    for (const unsigned version : kAcceptedVersions) {
        SCOPED_TRACE(version);
        // Read into a set that holds other content: none of it survives.
        AllOptions read = randomOptions(rng);
        readWhole(read, assemble(source, version));

        AllOptions expected;
        for (const Row& row : kRows)
            if (row.since <= version) row.copy(source, expected);
        if (version < 21) { // the stored ids follow the two default channels
            expected.channels = {126, 125};
            expected.channels.insert(expected.channels.end(), source.channels.begin(), source.channels.end());
        }
        EXPECT_TRUE(read.isEqual(expected)) << differenceOf(read, expected);

        // The record table writes the same older record.
        read.channels = source.channels;
        QuickArchive old;
        old.write(VersionWord::make(1, static_cast<std::uint16_t>(version)));
        ASSERT_TRUE(record::writeFields(old, read, AllOptions::recordFields(), version));
        EXPECT_EQ(bytesOf(old), bytesOf(assemble(source, version)));
    }
}

TEST(AllOptions, RejectedRecordsSayWhy) {
    std::mt19937 rng(12);
    AllOptions source = randomOptions(rng);
    using Append = void (*)(QuickArchive&);
    const Append nothing = [](QuickArchive&) {};
    // The record under `word`, up to the field `stopAt` (all of it for nullptr),
    // then `append`. (A channel count beyond the data: HostileInputTest.)
    const std::tuple<VersionWord, const char*, Append, std::string> cases[] = {
        {VersionWord::make(1, 10), nullptr, nothing, "unknown options version (1, 10)"},
        {VersionWord::make(1, 15), nullptr, nothing, "unknown options version (1, 15)"},
        {VersionWord::make(1, 24), nullptr, nothing, "unknown options version (1, 24)"},
        {VersionWord::make(0, 23), nullptr, nothing, "unknown options version (0, 23)"},
        {VersionWord::make(2, 9), nullptr, nothing, "unknown options version (2, 9)"},
        {VersionWord::make(1, 23), "bg_tex", [](QuickArchive& ar) { ar.write(true), ar.write(std::int32_t{41}); },
         R"(texture "bg_tex": unknown texture kind 41)"},
    };
    for (const auto& [word, stopAt, append, failure] : cases) {
        QuickArchive ar = assemble(source, 23, word, stopAt);
        append(ar);
        AllOptions o = source;
        EXPECT_FALSE(o.readFromArchive(ar)) << failure;
        ASSERT_TRUE(ar.failure()) << failure;
        EXPECT_TRUE(ar.failure()->describe().starts_with(failure)) << ar.failure()->describe();
        if (!stopAt) { // a rejected version word: nothing of the record is read
            EXPECT_TRUE(o.isEqual(AllOptions{})) << differenceOf(o, AllOptions{});
        }
    }
}

TEST(AllOptions, ChannelListRules) {
    using Ids = std::vector<std::uint32_t>;
    const std::tuple<unsigned, Ids, Ids> cases[] = {
        {20, {117}, {126, 125, 117}},        // added to the defaults
        {21, {117}, {117}},                  // replacing them
        {23, {}, {}},
        {0, {8, 117}, {126, 125, 123, 117}}, // version 0's normals id
        {1, {8, 117}, {126, 125, 117}},
        {23, {99, 100, 132, 133, 8, 0xFFFFFFFF, 126}, {100, 132, 126}},
        {22, {125, 125}, {125, 125}},
    };
    for (const auto& [version, stored, expected] : cases) {
        AllOptions source;
        source.channels = stored;
        AllOptions o;
        readWhole(o, assemble(source, version));
        EXPECT_EQ(o.channels, expected) << "version " << version;
    }
}

TEST(AllOptions, FileNamesKeepAtMost2047Utf16Units) {
    const std::string clapper = "\xF0\x9F\x8E\xAC"; // one character, two UTF-16 units
    const std::pair<std::string, std::string> cases[] = {
        {std::string(3000, 'a'), std::string(2047, 'a')},
        {std::string(2047, 'b'), std::string(2047, 'b')},
        {std::string(2046, 'c') + clapper + "d", std::string(2046, 'c')}, // the pair would straddle the end
        {std::string(2045, 'e') + clapper + "f", std::string(2045, 'e') + clapper},
    };
    for (const auto& [stored, kept] : cases) {
        AllOptions source, o;
        source.img_file = source.caustics_auto_save_file = stored;
        readWhole(o, assemble(source, 23));
        EXPECT_TRUE(o.img_file == kept && o.caustics_auto_save_file == kept);
        // A longer name set in memory is stored as the part the set keeps.
        ASSERT_TRUE(readInto(o, recordOf(source)));
        EXPECT_EQ(o.img_file, kept);
    }
}

// (A file's framing in archive chunks: FileContainerTest.)
TEST(AllOptions, AnOptionsFileConvertsToTheDocumentOfItsSet) {
    std::mt19937 rng(77);
    AllOptions o = randomOptions(rng);
    o.gi_tex = createTexture(BaseTexture::kSky), o.reflect_tex = createTexture(BaseTexture::kSky);
    QuickArchive ar(1);
    ASSERT_TRUE(o.writeToArchive(ar));
    std::string bytes; // the file: the archive's chunks
    for (const auto& chunk : ar.chunks()) bytes.append(reinterpret_cast<const char*>(chunk->data()), ar.kChunkSize);
    const std::string direct = documentOf(o);
    EXPECT_EQ(convertBytesToXml(FileKind::RenderOptions, bytes), direct);
    // Nothing carries over between conversions.
    EXPECT_EQ(convertBytesToXml(FileKind::RenderOptions, bytes), direct);

    // A record the set rejects passes the file through as text: its bytes up to
    // the first zero byte, here the version word's low half.
    const ByteVector version12 = withVersion(ByteVector(4096), 1, 12);
    EXPECT_EQ(convertBytesToXml(FileKind::RenderOptions, std::string(version12.begin(), version12.end())), "\x01");
}
