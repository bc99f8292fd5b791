// Hostile input: stated counts far beyond the data, nesting far beyond the limit,
// every truncation and byte change of the sample files, paths that cannot be read,
// and the reason each reader family records when it refuses a record.
#include "MaterialTestSupport.hpp"

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/dexmor.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/options/RenderView.hpp>
#include <dexmor/params/AnimatedParams.hpp>
#include <dexmor/params/GeomMapChannel.hpp>
#include <dexmor/platform/Text.hpp>
#include <dexmor/textures/BitmapBuffer.hpp>
#include <dexmor/textures/Textures.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <functional>
#include <limits>
#include <tuple>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace materialtest;
using namespace testsupport;
namespace fs = std::filesystem;

namespace {

constexpr std::uint32_t kHuge = 4000000000u;
constexpr double kInf = std::numeric_limits<double>::infinity();

// A material library of generation 2: the header, then the archive bytes as they are.
std::string libraryFile(std::uint32_t count, const ByteVector& archive) {
    return textOf(Image{}.version(0, 2).u32(count).append(archive).bytes);
}

// The position of the only occurrence of `needle` in `bytes`.
std::size_t findOnce(const ByteVector& bytes, const ByteVector& needle) {
    const auto at = std::search(bytes.begin(), bytes.end(), needle.begin(), needle.end());
    EXPECT_NE(at, bytes.end());
    EXPECT_EQ(std::search(at + 1, bytes.end(), needle.begin(), needle.end()), bytes.end());
    return static_cast<std::size_t>(at - bytes.begin());
}

// Reads a file's bytes as the conversion does; nullopt when it reads as binary.
std::optional<ReadFailure> whyNotBinary(FileKind kind, const std::string& bytes) {
    if (kind == FileKind::MaterialLibrary) {
        ZelMatFile file;
        if (file.readFromBytes(bytes)) return std::nullopt;
        return file.lastReadFailure().value_or(ReadFailure{"(no reason recorded)", 0, {}});
    }
    ZelOptFile file;
    AllOptions options;
    if (file.readBytes(options, bytes)) return std::nullopt;
    return file.lastReadFailure().value_or(ReadFailure{"(no reason recorded)", 0, {}});
}

// What a conversion may give: the document, or the file's text up to its first NUL.
void expectDocumentOrText(FileKind kind, const std::string& bytes, const std::string& what) {
    const std::string out = convertBytesToXml(kind, bytes);
    if (out.starts_with("<Assets>\n") && out.ends_with("</Assets>\n")) return;
    EXPECT_EQ(out, text::decodeStoredText(text::upToFirstNul(bytes))) << what;
}

// The record of a render-options set, with the camera's focal length as a marker.
ByteVector optionsRecord(AllOptions& options) {
    options.camera.focal_length.setConstant(1234.5f);
    return testsupport::recordOf(options);
}

using HostileInput = LibraryTest; // (a fresh conversion context per test: FreshContextPerTest)

} // namespace

// --- stated counts ---

TEST_F(HostileInput, CountsOfFourBillionInASmallFileFailAtOnce) {
    AllOptions withKeys;
    ByteVector keys = optionsRecord(withKeys);
    keys = withWord(keys, findOnce(keys, testsupport::recordOf(withKeys.camera.focal_length)) + 4, kHuge);

    AllOptions withChannels;
    withChannels.channels = {131, 100, 117};
    ByteVector channels = testsupport::recordOf(withChannels);
    channels = withWord(channels, findOnce(channels, Image{}.u32(3).u32(131).u32(100).u32(117).bytes), kHuge);

    const struct {
        const char* what;
        FileKind kind;
        std::string bytes;
    } cases[] = {
        {"materials", FileKind::MaterialLibrary,
         textOf(Image{}.version(0, 3).u32(kHuge).u32(1).append(ByteVector(4096)).bytes)},
        {"BRDF layers", FileKind::MaterialLibrary,
         libraryFile(1, Image{}.i32(BaseMaterial::kLayeredBRDF).version(0, MaterialLayeredBRDF::kInfo.version)
                            .u32(kHuge).bytes)},
        {"sub-materials", FileKind::MaterialLibrary,
         libraryFile(1, Image{}.i32(BaseMaterial::kMulti).version(0, MaterialMulti::kInfo.version).u32(kHuge).bytes)},
        {"object names", FileKind::MaterialLibrary,
         libraryFile(1, Image{}.i32(BaseMaterial::kObjectExclusion).version(0, MaterialObjectExclusion::kInfo.version)
                        .i32(0).flag(false).u32(kHuge).bytes)},
        {"animation keys", FileKind::RenderOptions, textOf(keys)},
        {"render channels", FileKind::RenderOptions, textOf(channels)},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const auto failure = whyNotBinary(c.kind, c.bytes);
        ASSERT_TRUE(failure);
        EXPECT_NE(failure->reason.find("4000000000"), std::string::npos) << failure->describe();
        expectDocumentOrText(c.kind, c.bytes, c.what);
    }
}

// --- nesting ---

TEST_F(HostileInput, NestingOfAHundredThousandLevelsFailsTheFileAtTheLimit) {
    // Bump materials, each the base material of the one before.
    Image bumps;
    for (int i = 0; i < 100000; ++i) bumps.i32(BaseMaterial::kBump).version(0, 3).f32({1}).flag(false);
    // One bump material whose bump texture is an invert texture of an invert texture ...
    Image textures;
    textures.i32(BaseMaterial::kBump).version(0, 3).f32({1}).flag(true);
    for (int i = 0; i < 100000; ++i) textures.i32(BaseTexture::kInvert).version(0, 1);

    const struct {
        const char* what;
        ByteVector archive;
        std::uint64_t offset; // where the member one level too deep begins, in the file
    } cases[] = {
        {"bump in bump", bumps.bytes, 8 + 256 * 13},              // the material record is level 1
        {"texture in texture", textures.bytes, 8 + 13 + 255 * 8}, // its first texture is level 2
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const std::string file = libraryFile(1, c.archive);
        const auto failure = whyNotBinary(FileKind::MaterialLibrary, file);
        ASSERT_TRUE(failure);
        EXPECT_EQ(failure->reason, "records nested deeper than 256 levels");
        EXPECT_EQ(failure->offset, c.offset);
        EXPECT_TRUE(failure->recordPathText().starts_with("material 0 / ")) << failure->recordPathText().substr(0, 80);
        EXPECT_EQ(convertBytesToXml(FileKind::MaterialLibrary, file), "");
    }
}

// --- damaged samples ---

TEST_F(HostileInput, EveryTruncationOfTheSamplesConverts) {
    for (const auto& [kind, name] : {std::pair{FileKind::MaterialLibrary, "sample.zelmat"},
                                     std::pair{FileKind::RenderOptions, "sample.zelopt"}}) {
        const std::string whole = sampleFile(name);
        ASSERT_FALSE(whole.empty()) << name;
        ASSERT_FALSE(whyNotBinary(kind, whole)) << name;
        for (std::size_t n = 0; n < whole.size(); ++n)
            expectDocumentOrText(kind, whole.substr(0, n), name + (" cut at " + std::to_string(n)));
    }
}

TEST_F(HostileInput, SingleByteChangesOfTheSamplesConvert) {
    // Every offset of the options sample; of the larger library sample its header
    // and every 29th byte (a conversion of it takes a while under the sanitizers).
    // Bits flipped: all of them at even offsets, the lowest at odd ones.
    for (const auto& [kind, name, stride] : {std::tuple{FileKind::RenderOptions, "sample.zelopt", 1},
                                             std::tuple{FileKind::MaterialLibrary, "sample.zelmat", 29}}) {
        const std::string whole = sampleFile(name);
        ASSERT_FALSE(whole.empty()) << name;
        for (std::size_t at = 0; at < whole.size(); at += at < 12 ? 1 : stride) {
            std::string damaged = whole;
            damaged[at] = static_cast<char>(damaged[at] ^ (at % 2 ? 0x01 : 0xFF));
            expectDocumentOrText(kind, damaged, name + (" changed at " + std::to_string(at)));
        }
    }
}

// --- paths that cannot be read ---

TEST(HostileInputPaths, AFileWithoutReadPermissionGivesTheEmptyText) {
    // (A directory, a FIFO and a missing path: see FileContainerTest.)
    const TempDir dir;
    const fs::path file = dir.file("locked.zelmat", "<Assets/>");
    ASSERT_EQ(::chmod(dir.path().c_str(), 0755), 0);
    ASSERT_EQ(::chmod(file.c_str(), 0), 0);

    const auto convertsToEmptyText = [&] {
        return convertToXml(FileKind::MaterialLibrary, file).empty() &&
               convertToXml(FileKind::RenderOptions, file).empty() && !diagnose(FileKind::RenderOptions, file).opened;
    };
    if (::geteuid() != 0) {
        EXPECT_TRUE(convertsToEmptyText());
    } else {
        // Permissions do not bind root: the file reads here, and not in a child that gave root up.
        EXPECT_EQ(convertToXml(FileKind::MaterialLibrary, file), "<Assets/>");
        const pid_t child = ::fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            if (::setgid(65534) != 0 || ::setuid(65534) != 0) ::_exit(2);
            ::_exit(convertsToEmptyText() ? 0 : 1);
        }
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << "child status " << status;
    }
}

// --- the reason of every reader family ---

namespace {

// A record damaged in one place, how it is read, and the failure it must record.
struct Damaged {
    const char* family;
    ByteVector bytes;
    std::function<bool(QuickArchive&)> read;
    std::string recordPath;
    std::uint64_t offset;
    std::string reason; // a part of the reason
};

bool readMaterial(QuickArchive& ar) {
    MaterialPtr m;
    return readMember(ar, m, nullptr, 0);
}

template <class Object>
std::function<bool(QuickArchive&)> readAs() {
    return [](QuickArchive& ar) { return Object("x").readFromArchive(ar); };
}

// A bump material named "Oak" over an empty layered material, with `texture` as its bump texture.
MaterialPtr bumpWith(const TexturePtr& texture) {
    auto bump = make<MaterialBump>("Oak");
    bump->baseMtl = make<MaterialLayeredBRDF>("Base");
    bump->bumpTex = texture;
    return bump;
}

constexpr std::uint32_t kBadVersion = 99u << 16; // (0, 99)
constexpr std::size_t kBumpTexture = 13;         // kind, version, bumpTexMult, present flag

std::vector<Damaged> damagedRecords() {
    using testsupport::recordOf;
    std::vector<Damaged> rows;
    const auto add = [&rows](const char* family, ByteVector bytes, std::function<bool(QuickArchive&)> read,
                             std::string path, std::uint64_t offset, std::string reason) {
        rows.push_back({family, std::move(bytes), std::move(read), std::move(path), offset, std::move(reason)});
    };

    add("material", withWord(storedForm(bumpWith(nullptr)), 4, kBadVersion), readMaterial, "material 0", 8,
        "unknown bump material version (0, 99)");

    auto layered = make<MaterialLayeredBRDF>("Layers");
    layered->layers = {boost::make_shared<Diffuse_BRDF>()};
    add("BRDF layer", withWord(storedForm(layered), 16, kBadVersion), readMaterial, "material 0 / BRDF layer 0",
        20, "unknown diffuse BRDF version (0, 99)");

    // A host two-sided material stores its name ahead of its sides, so a failing
    // side is shown under that name: quoted, escaped and cut after 60 bytes. A
    // side's name is not read yet when its version word fails.
    auto twoSided = make<MaterialSkp2Sided>("Oak \"Heart\"\t" + std::string(100, 'x'));
    twoSided->front = make<MaterialLayeredBRDF>("Front");
    twoSided->back = make<MaterialLayeredBRDF>("Back");
    const ByteVector sides = storedForm(twoSided);
    const std::size_t front = findOnce(sides, testsupport::recordOf(*twoSided->front));
    add("named material", withWord(sides, front, kBadVersion), readMaterial,
        R"(material 0 "Oak \"Heart\"\x09)" + std::string(48, 'x') + R"(..." / material "front")", front + 4,
        "unknown layered material version (0, 99)");

    const std::size_t texture = kBumpTexture + 4; // after the texture's kind id
    add("texture", withWord(storedForm(bumpWith(boost::make_shared<AColorTexture>())), texture, kBadVersion),
        readMaterial, R"(material 0 / texture "bump_tex")", texture + 4, "unknown colour texture version (0, 99)");

    auto bitmap = boost::make_shared<BitmapTexture>();
    bitmap->uvwgen = boost::make_shared<GenChannelUVW>();
    bitmap->bitmap = boost::make_shared<BitmapBuffer>();
    const ByteVector withBitmap = storedForm(bumpWith(bitmap));
    const std::size_t uvwKind = texture + 4, uvw = texture + 12; // after the version; after both kind ids
    add("UVW generator kind", withWord(withBitmap, uvwKind, 77), readMaterial, R"(material 0 / texture "bump_tex")",
        uvwKind + 4, "unknown UVW generator kind 77");
    add("UVW generator", withWord(withBitmap, uvw, kBadVersion), readMaterial,
        R"(material 0 / texture "bump_tex" / UVW generator "uvwgen")", uvw + 4,
        "unknown channel UVW generator version (0, 99)");
    const std::size_t buffer = uvw + recordOf(*bitmap->uvwgen).size();
    add("bitmap", withWord(withBitmap, buffer, kBadVersion), readMaterial,
        R"(material 0 / texture "bump_tex" / bitmap "bitmap")", buffer + 4, "unknown bitmap buffer version (0, 99)");

    // The sky record ends with the default sun's record and a Bool.
    auto sky = boost::make_shared<SkyTexture>();
    const std::size_t sun = texture + recordOf(*sky).size() - 1 - recordOf(*sharedDefaultSun()).size();
    add("light", withWord(storedForm(bumpWith(sky)), sun, kBadVersion), readMaterial,
        R"(material 0 / texture "bump_tex" / light "default sun")", sun + 4, "unknown sun light version (0, 99)");

    AllOptions options;
    options.params.lightCache.str1 = "cache-file-name";
    const ByteVector set = optionsRecord(options);
    const auto readOptions = [](QuickArchive& ar) { return AllOptions().readFromArchive(ar); };
    add("options set", withWord(set, 0, VersionWord::make(1, 99).raw), readOptions, "", 4,
        "unknown options version (1, 99)");
    const std::size_t text = findOnce(set, Image{}.text("cache-file-name").bytes);
    add("settings section", withWord(set, text, kHuge), readOptions, "params / lightCache.str1", text + 4,
        "a string of 4000000000 bytes");
    const std::size_t frameData = 4 + recordOf(options.params).size();
    add("frame data", withWord(set, frameData, kBadVersion), readOptions, "frameData", frameData + 4,
        "unknown frame data version (0, 99)");
    const std::size_t stampInfo = frameData + recordOf(options.frameData).size();
    add("stamp info", withWord(set, stampInfo + 16, kHuge), readOptions, "stampInfo / text", stampInfo + 20,
        "a string of 4000000000 bytes"); // after the version and three integers
    const std::size_t camera = stampInfo + recordOf(options.stampInfo).size();
    add("camera", withWord(set, camera, kBadVersion), readOptions, "camera", camera + 4,
        "unknown physical camera version (0, 99)");
    const std::size_t keys = findOnce(set, recordOf(options.camera.focal_length));
    add("animated value", withWord(set, keys + 8, 4), readOptions, "camera / focal_length", keys + 12,
        "animated real key times of 4 bytes");

    RenderView view;
    const ByteVector viewRecord = recordOf(view);
    const std::size_t transform = findOnce(viewRecord, recordOf(view.transform));
    add("render view", withWord(viewRecord, transform + 4, kHuge),
        [](QuickArchive& ar) { return RenderView().readFromArchive(ar); }, "transform", transform + 8,
        "4000000000 keys do not fit");

    // Version, name, then the keys' record: version, count, time size, (flag,) keys.
    DefAnimTransformParam placement("placement");
    add("animated parameter", withWord(recordOf(placement), 4 + 13 + 4, kHuge), readAs<DefAnimTransformParam>(), "",
        4 + 13 + 8, "4000000000 keys do not fit");
    DefAnimIntParam count("count");
    ByteVector nanKey = recordOf(count); // its only key: Float64 time, Int32 value
    std::memcpy(nanKey.data() + nanKey.size() - 12, "\0\0\0\0\0\0\xF8\x7F", 8);
    add("animated parameter key", nanKey, readAs<DefAnimIntParam>(), "", nanKey.size() - 4,
        "key time that is not a number");

    DefSerialVectorListParam tverts("tverts");
    add("list parameter", withWord(recordOf(tverts), 4, kHuge), readAs<DefSerialVectorListParam>(), "", 8,
        "vector list of 4000000000 elements");
    DefGeomMapChannel channels("mapping");
    auto channel = boost::make_shared<GeomMapChannel>(1);
    channel->setFaces(std::vector<std::int32_t>{0, 1, 2});
    channels.addChannel(channel);
    const std::size_t faces = 4 + 11 + 4 + 4 + 4 + 1; // list version, name, count; channel version, number, flag
    add("map channel", withWord(recordOf(channels), faces + 8, 2), readAs<DefGeomMapChannel>(), "map channel 0 / faces",
        faces + 12, "integer list elements of 2 bytes");
    return rows;
}

} // namespace

TEST_F(HostileInput, EveryReaderFamilyNamesTheRecordAndOffsetOfItsFailure) {
    for (const Damaged& row : damagedRecords()) {
        SCOPED_TRACE(row.family);
        QuickArchive ar(row.bytes.data(), row.bytes.size());
        EXPECT_FALSE(row.read(ar));
        ASSERT_TRUE(ar.failure());
        EXPECT_EQ(ar.failure()->recordPathText(), row.recordPath) << ar.failure()->describe();
        EXPECT_EQ(ar.failure()->offset, row.offset) << ar.failure()->describe();
        EXPECT_NE(ar.failure()->reason.find(row.reason), std::string::npos) << ar.failure()->describe();
        const ConversionContext fresh2;
    }
}

// --- found in the sweep ---

TEST(HostileInputSweep, KeysStoredInAnyOrderReadAsIfSetOneByOne) {
    // Descending times with repeats (a later key of a time wins), both zeros and
    // both infinities; read at once, not in time quadratic in the count.
    std::vector<std::pair<double, float>> keys = {{-0.0, 7}, {kInf, 1}, {-kInf, 2}, {0.0, 8}};
    for (int i = 0; i < 5000; ++i) keys.emplace_back((5000 - i) / 2, static_cast<float>(i));
    Image record;
    record.version(0, 1).u32(static_cast<std::uint32_t>(keys.size())).u32(8).flag(true);
    AnimatedReal expected;
    for (const auto& [time, value] : keys) {
        record.f64(time).f32({value});
        expected.setValue(value, time);
    }
    AnimatedReal read;
    ASSERT_TRUE(testsupport::readInto(read, record.bytes));
    EXPECT_EQ(read.keyCount(), 2503);
    EXPECT_TRUE(read == expected);
    EXPECT_FALSE(std::signbit(read.keys()[1].time)); // the default key at 0 keeps its time
}
