// The archive's byte layouts, its chunking, and its guards against damaged data.
#include "TrimSupport.hpp"

#include <dexmor/archive/Record.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

QuickArchive archiveOver(const ByteVector& bytes) { return QuickArchive(bytes.data(), bytes.size()); }

} // namespace

TEST(Archive, PrimitivesAreLittleEndianAndPacked) {
    QuickArchive ar;
    ar.write(Transform{Matrix::identity(), Vector{1, 2, 3}});
    ar.write(VersionWord::make(0, 3));
    ar.write(true);
    ar.write(std::int32_t{-2});
    ar.write(1.0);
    const auto bytes = bytesOf(ar);
    EXPECT_EQ(bytes, Image{}.f32({1, 0, 0, 0, 1, 0, 0, 0, 1, 1, 2, 3}).version(0, 3).flag(true).i32(-2).f64(1.0).bytes);
    QuickArchive back = archiveOver(bytes);
    EXPECT_EQ(back.get<Transform>(), (Transform{Matrix::identity(), Vector{1, 2, 3}}));
    EXPECT_EQ(back.get<VersionWord>(), VersionWord::make(0, 3));
    EXPECT_TRUE(back.get<bool>() && back.get<std::int32_t>() == -2 && back.get<double>() == 1.0);
    // Any non-zero byte reads as true.
    QuickArchive flags = archiveOver({0x00, 0x02, 0xFF});
    EXPECT_TRUE(!flags.get<bool>() && flags.get<bool>() && flags.get<bool>());
}

TEST(Archive, StringsAreCutAtTheirFirstNul) {
    QuickArchive ar = archiveOver({0, 0, 0, 0, 4, 0, 0, 0, 'a', 'b', 0, 'c', 0x2A});
    std::string empty = "old", s;
    ASSERT_TRUE(ar.readString(empty) && ar.readString(s));
    EXPECT_TRUE(empty.empty() && s == "ab");
    EXPECT_EQ(ar.get<std::uint8_t>(), 0x2A); // after the whole stored string
}

TEST(Archive, WideStringsAreUtf8WithAWindows1252Fallback) {
    QuickArchive ar;
    ar.writeWString("Caf\xC3\xA9 \xE2\x82\xAC");      // "Café €"
    ar.writeString("Caf\xE9 \x80");                     // the same in Windows-1252
    ar.writeWString(std::string("cut\0here", 8));       // stored up to its NUL
    ar.writeWString("\xFF\xFE not UTF-8");              // not storable: written empty
    const auto bytes = bytesOf(ar);
    EXPECT_EQ(bytes[0], 9u); // UTF-8 length

    QuickArchive back = archiveOver(bytes);
    std::string a, b, c, d = "old";
    ASSERT_TRUE(back.readWString(a) && back.readWString(b) && back.readWString(c) && back.readWString(d));
    EXPECT_EQ(std::tuple(a, b, c, d), std::tuple("Caf\xC3\xA9 \xE2\x82\xAC", "Caf\xC3\xA9 \xE2\x82\xAC", "cut", ""));
}

TEST(Archive, ChunksGrowByOneAndSaveWhole) {
    std::ostringstream emptyImage;
    QuickArchive(1).save(emptyImage);
    EXPECT_EQ(emptyImage.str().size(), 4u + 4096u);

    QuickArchive ar(1);
    for (int i = 0; i < 4097; ++i) ar.putByte(static_cast<std::uint8_t>(i));
    EXPECT_EQ(ar.chunkCount(), 2u);
    std::ostringstream out;
    ar.save(out);
    const std::string image = out.str();
    ASSERT_EQ(image.size(), 4u + 8192u);
    EXPECT_EQ(image.substr(0, 4), std::string("\x02\x00\x00\x00", 4));

    // After loading, the write position is 0 and reading crosses chunk boundaries.
    std::istringstream in(image);
    QuickArchive loaded(1);
    ASSERT_TRUE(loaded.load(in));
    EXPECT_EQ(loaded.writePosition(), 0u);
    loaded.skip(4094);
    std::uint8_t b[3] = {};
    EXPECT_TRUE(loaded.getRaw(b, 3));
    EXPECT_TRUE(b[0] == static_cast<std::uint8_t>(4094) && b[2] == static_cast<std::uint8_t>(4096));
}

TEST(Archive, LoadRejectsTruncatedAndOversizedImages) {
    for (const std::string& image : {std::string("\x01\x00", 2), std::string("\x01\x00\x00\x00", 4) + "short",
                                    std::string("\xFF\xFF\xFF\xFF", 4), std::string("\x00\x00\x10\x00", 4)}) {
        std::istringstream in(image);
        QuickArchive ar;
        EXPECT_FALSE(ar.load(in));
        EXPECT_TRUE(ar.failed());
    }
}

TEST(Archive, ReadsPastTheEndKeepTheDestination) {
    QuickArchive ar = archiveOver({1, 0, 0, 0});
    ar.skip(4096); // past the only chunk
    std::int32_t i = 77;
    Color c{5, 5, 5};
    ar.read(i), ar.read(c); // compound values assemble into zeros
    EXPECT_TRUE(i == 77 && c == (Color{0, 0, 0}));
    EXPECT_FALSE(ar.failed()); // a plain read past the end is not a failure
}

TEST(Archive, BytesBlocksHonourTheStrictnessFlag) {
    QuickArchive ar;
    std::array<std::uint8_t, 24> stored{};
    for (std::size_t i = 0; i < stored.size(); ++i) stored[i] = static_cast<std::uint8_t>(i);
    ar.writeBytes(stored.data(), 24);
    ar.write(std::int32_t{99});

    std::array<std::uint8_t, 12> buffer{};
    QuickArchive lax = ar, strict = ar;
    EXPECT_EQ(lax.readBytes(buffer.data(), 12, false), 24u);
    EXPECT_EQ(buffer[11], 11);
    EXPECT_EQ(lax.get<std::int32_t>(), 99); // the surplus was skipped

    EXPECT_EQ(strict.readBytes(buffer.data(), 12, true), 24u);
    EXPECT_EQ(strict.readPosition(), 0u); // back at the count
}

TEST(Archive, CountsBeyondTheDataFailWithoutAllocating) {
    // A count of 4,000,000,000 in a one-chunk archive.
    QuickArchive ar = archiveOver({0x00, 0x28, 0x6B, 0xEE});
    std::string s = "kept";
    EXPECT_FALSE(ar.readString(s));
    EXPECT_EQ(s, "kept");
    EXPECT_NE(failureOf(ar).find("4000000000"), std::string::npos);

    QuickArchive block = archiveOver({0xFF, 0xFF, 0xFF, 0xFF});
    std::uint8_t b[4];
    EXPECT_FALSE(block.readBytes(b, 4, false).has_value());
    EXPECT_TRUE(QuickArchive(1).canHold(4096 / 8, 8));
    EXPECT_FALSE(QuickArchive(1).canHold(4096 / 8 + 1, 8) || QuickArchive(1).canHold(std::uint64_t{1} << 62, 8));
}

TEST(Archive, FailuresKeepTheFirstReasonAndTheRecordPath) {
    QuickArchive ar;
    {
        QuickArchive::Scope material(ar, "material", nullptr, 3);
        QuickArchive::Scope layer(ar, "BRDF layer", nullptr, 2);
        QuickArchive::Scope texture(ar, "texture", "color_tex");
        ar.skip(10);
        EXPECT_FALSE(ar.fail("unknown texture kind 41"));
        EXPECT_FALSE(ar.fail("a later failure"));
    }
    ASSERT_TRUE(ar.failed());
    EXPECT_EQ(ar.failure()->describe(),
              "material 3 / BRDF layer 2 / texture \"color_tex\": unknown texture kind 41 at offset 10");
}

TEST(Archive, NestingIsLimited) {
    QuickArchive ar;
    std::vector<std::unique_ptr<QuickArchive::Scope>> scopes;
    for (unsigned i = 0; i < QuickArchive::kMaxNesting; ++i) {
        scopes.push_back(std::make_unique<QuickArchive::Scope>(ar, "texture"));
        ASSERT_TRUE(*scopes.back());
    }
    EXPECT_TRUE(QuickArchive::Scope::label(ar, "a field")); // labels do not nest
    QuickArchive::Scope tooDeep(ar, "texture");
    EXPECT_FALSE(tooDeep);
    EXPECT_TRUE(ar.failed());
}

namespace {

struct Group {
    std::int32_t on = 0;
    float amount = 1.0f;
};
struct Block {
    Group group;
    Color color{0.5f, 0.5f, 0.5f};
    std::string file;
    std::uint32_t mode = 7;
    bool flag = true;
};

constexpr std::array<record::Field<Block>, 6> kBlockFields = {
    record::field<&Block::group, &Group::on>("group.on"),
    record::discarded<Block, float>("legacy", record::between(1, 1)),
    record::field<&Block::color>("color"),
    record::field<&Block::group, &Group::amount>("group.amount", record::since(2)),
    record::field<&Block::file>("file"),
    record::field<&Block::mode>("mode", record::since(3)),
};

} // namespace

TEST(RecordTable, ReadsAndWritesTheFieldsOfEachVersion) {
    Block source;
    source.group = {5, 2.5f}, source.color = {1, 2, 3}, source.file = "t\xC3\xBCr.png", source.mode = 9;

    QuickArchive ar;
    ASSERT_TRUE(record::writeFields(ar, source, kBlockFields, 3));
    EXPECT_EQ(ar.writePosition(), 4u + 12 + 4 + 4 + 8 + 4);
    Block back;
    ASSERT_TRUE(record::readFields(ar, back, kBlockFields, 3));
    EXPECT_TRUE(record::fieldsEqual(source, back, kBlockFields));

    // Version 1 holds a discarded float and neither the amount nor the mode.
    const ByteVector v1 = Image{}.i32(4).f32({9.5f, 1, 1, 1}).text("x").bytes;
    QuickArchive old = archiveOver(v1);
    Block fromOld;
    ASSERT_TRUE(record::readFields(old, fromOld, kBlockFields, 1));
    EXPECT_TRUE(fromOld.group.on == 4 && fromOld.group.amount == 1.0f && fromOld.file == "x" && fromOld.mode == 7u);

    fromOld.mode = 8;
    EXPECT_STREQ(record::firstDifference(fromOld, Block{fromOld.group, fromOld.color, fromOld.file, 7, true},
                                         kBlockFields),
                 "mode");
}

TEST(RecordTable, AFailingFieldNamesItselfInTheFailure) {
    QuickArchive ar = archiveOver(Image{}.i32(1).f32({0, 0, 0, 1}).u32(0xFFFFFFF0).bytes); // the file name's length
    Block back;
    EXPECT_FALSE(record::readFields(ar, back, kBlockFields, 2));
    ASSERT_TRUE(ar.failed());
    EXPECT_EQ(ar.failure()->recordPathText(), "file");
}
