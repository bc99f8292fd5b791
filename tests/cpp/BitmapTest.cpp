// Bitmap buffers: the factory, the record, comparison of file names and the XML asset.
#include "TrimSupport.hpp"

#include <dexmor/textures/BitmapBuffer.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

boost::shared_ptr<BitmapBuffer> buffer(std::string file, std::int32_t filterType = 1, float blur = 0.15f,
                                       float gamma = 1.0f) {
    auto b = boost::make_shared<BitmapBuffer>();
    b->file = std::move(file);
    b->filter_type = filterType, b->filter_blur = blur, b->gamma = gamma;
    return b;
}

} // namespace

TEST(Bitmap, FactoryFilterNamesAndDefaultRecord) {
    for (std::int32_t kind : {1, -1, INT32_MIN}) EXPECT_FALSE(createBitmap(kind)) << kind;
    // So a bitmap member naming kind 1 is refused.
    const ByteVector member = {1, 0, 0, 0, 0, 0, 1, 0};
    QuickArchive ar(member.data(), member.size());
    BitmapPtr bitmap;
    EXPECT_FALSE(readMember(ar, bitmap, "bitmap"));
    EXPECT_NE(failureOf(ar).find("kind 1"), std::string::npos) << failureOf(ar);

    EXPECT_EQ(bitmapFilterName(2), "Summed-area");
    for (std::int32_t type : {-1, 3, INT32_MIN, INT32_MAX}) EXPECT_EQ(bitmapFilterName(type), "") << type;

    BitmapBuffer b; // version, filter_type 1, filter_blur 0.15, gamma 1, empty file
    EXPECT_EQ(recordOf(b), (ByteVector{0, 0, 1, 0, 1, 0, 0, 0, 0x9A, 0x99, 0x19, 0x3E, 0, 0, 0x80, 0x3F, 0, 0, 0, 0}));
}

// File names of ASCII, markup characters and two- to four-byte UTF-8 survive
// unchanged; every stored byte takes part in comparison.
TEST(Bitmap, RandomRoundTripsClonesAndComparison) {
    std::mt19937 rng(7);
    std::uniform_real_distribution<float> real(-100.0f, 100.0f);
    for (int round = 0; round < 50; ++round) {
        const auto original = buffer(rng() % 4 ? randomText(rng, 40) + ".png" : "", static_cast<std::int32_t>(rng()),
                                     real(rng), real(rng));
        const ByteVector bytes = expectRoundTrip(original, [] { return boost::make_shared<BitmapBuffer>(); });
        if (round < 3) expectEveryStoredByteCompared(original, bytes, [] { return createBitmap(0); });
    }
}

TEST(Bitmap, ComparisonIgnoresTheCaseOfAsciiLettersInFileNamesOnly) {
    const auto oak = buffer("C:\\Maps\\Oak.PNG");
    EXPECT_TRUE(oak->isEqual(buffer("c:\\maps\\oak.png")));
    EXPECT_FALSE(oak->isEqual(buffer("C:\\Maps\\Oak.PNG ")));
    EXPECT_FALSE(buffer("\xC3\x84.png")->isEqual(buffer("\xC3\xA4.png"))); // Ä and ä
    EXPECT_FALSE(oak->isEqual(BitmapPtr()));
}

TEST(Bitmap, RefusedRecordsSayWhy) {
    // Version 0.2: refused, and the fields keep their values.
    const auto b = buffer("keep.png", 0, 0.5f, 2.0f);
    expectReadFails(*b, Image{}.version(0, 2).i32(2).f32({0, 0}).u32(0).bytes, "version (0, 2)");
    EXPECT_TRUE(b->isEqual(buffer("keep.png", 0, 0.5f, 2.0f)));
}

TEST(BitmapXml, AssetText) {
    const auto b = buffer("C:\\Texturen\\Gr\xC3\xB6\xC3\x9F" "e_\xE6\x9C\xA8.png", BitmapBuffer::kSummedArea, 0.25f,
                          2.2f);
    expectGolden(xmlOf(*b, "/Oak/diffuse/buffer"), "bitmap_buffer.xml");
}
