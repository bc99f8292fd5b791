// Bitmap buffers: the factory, the record, comparison of file names and the XML asset.
#include "archive/QuickArchive.hpp"
#include "textures/BitmapBuffer.hpp"
#include "xml/AssetXmlWriter.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

using namespace OrvexKavorCore;

namespace {

using ByteVector = std::vector<std::uint8_t>;

ByteVector recordOf(BaseBitmap& bitmap) {
    QuickArchive ar;
    EXPECT_TRUE(bitmap.writeToArchive(ar));
    ByteVector out(ar.writePosition());
    ar.getRaw(out.data(), out.size());
    return out;
}

boost::shared_ptr<BitmapBuffer> buffer(std::string file, std::int32_t filterType = 1, float blur = 0.15f,
                                       float gamma = 1.0f) {
    auto b = boost::make_shared<BitmapBuffer>();
    b->file = std::move(file);
    b->filter_type = filterType;
    b->filter_blur = blur;
    b->gamma = gamma;
    return b;
}

} // namespace

TEST(Bitmap, FactoryAndFilterNames) {
    const BitmapPtr made = createBitmap(0);
    ASSERT_TRUE(made);
    EXPECT_EQ(made->kindId(), 0);
    EXPECT_EQ(made->pluginType(), "BitmapBuffer");
    EXPECT_EQ(made->assetType(), "bitmap");
    for (std::int32_t kind : {1, -1, INT32_MIN}) EXPECT_FALSE(createBitmap(kind)) << kind;

    // So a bitmap member naming kind 1 is refused.
    const ByteVector member = {1, 0, 0, 0, 0, 0, 1, 0};
    QuickArchive ar(member.data(), member.size());
    BitmapPtr bitmap;
    EXPECT_FALSE(readMember(ar, bitmap, "bitmap"));
    ASSERT_TRUE(ar.failure());
    EXPECT_NE(ar.failure()->reason.find("kind 1"), std::string::npos) << ar.failure()->describe();

    EXPECT_EQ(bitmapFilterName(0), "No filter");
    EXPECT_EQ(bitmapFilterName(1), "Mip-map");
    EXPECT_EQ(bitmapFilterName(2), "Summed-area");
    for (std::int32_t type : {-1, 3, INT32_MIN, INT32_MAX}) EXPECT_EQ(bitmapFilterName(type), "") << type;
}

TEST(Bitmap, DefaultRecord) {
    BitmapBuffer b;
    EXPECT_EQ(recordOf(b), (ByteVector{
                               0x00, 0x00, 0x01, 0x00, // version 0.1
                               0x01, 0x00, 0x00, 0x00, // filter_type 1
                               0x9A, 0x99, 0x19, 0x3E, // filter_blur 0.15
                               0x00, 0x00, 0x80, 0x3F, // gamma 1.0
                               0x00, 0x00, 0x00, 0x00, // empty file
                           }));
}

// File names built from ASCII, markup characters and two-, three- and four-byte
// UTF-8 sequences survive unchanged.
TEST(Bitmap, RandomRoundTripsAndClones) {
    std::mt19937 rng(7);
    const char* const pieces[] = {
        "a", "B", "\\", " ", "&", "<", ".png", "\xC3\xA9", "\xE6\x9C\xA8", "\xF0\x9F\x8C\xB3"};
    std::uniform_int_distribution<std::size_t> piece(0, std::size(pieces) - 1), length(0, 40);
    std::uniform_real_distribution<float> real(-100.0f, 100.0f);
    std::uniform_int_distribution<std::int32_t> integer(INT32_MIN, INT32_MAX);
    for (int round = 0; round < 50; ++round) {
        std::string file;
        for (std::size_t n = length(rng); n > 0; --n) file += pieces[piece(rng)];
        const auto original = buffer(file, integer(rng), real(rng), real(rng));
        const ByteVector bytes = recordOf(*original);

        BitmapBuffer copy;
        QuickArchive ar(bytes.data(), bytes.size());
        ASSERT_TRUE(copy.readFromArchive(ar));
        EXPECT_EQ(ar.readPosition(), bytes.size());
        EXPECT_EQ(copy.file, file);
        EXPECT_TRUE(copy.isEqual(original));
        EXPECT_EQ(recordOf(copy), bytes);

        const BitmapPtr clone = original->clone();
        ASSERT_NE(clone, original);
        EXPECT_TRUE(clone->isEqual(original));
        EXPECT_EQ(recordOf(*clone), bytes);
    }
}

TEST(Bitmap, ComparisonIgnoresTheCaseOfAsciiLettersInFileNamesOnly) {
    const auto oak = buffer("C:\\Maps\\Oak.PNG");
    EXPECT_TRUE(oak->isEqual(buffer("c:\\maps\\oak.png")));
    EXPECT_FALSE(oak->isEqual(buffer("C:\\Maps\\Oak.PNG ")));
    EXPECT_FALSE(buffer("\xC3\x84.png")->isEqual(buffer("\xC3\xA4.png"))); // Ä and ä

    EXPECT_FALSE(oak->isEqual(buffer("C:\\Maps\\Oak.PNG", 2)));
    EXPECT_FALSE(oak->isEqual(buffer("C:\\Maps\\Oak.PNG", 1, 0.5f)));
    EXPECT_FALSE(oak->isEqual(buffer("C:\\Maps\\Oak.PNG", 1, 0.15f, 2.2f)));
    EXPECT_FALSE(oak->isEqual(BitmapPtr()));
}

TEST(Bitmap, RefusedRecordsSayWhy) {
    // Version 0.2: refused, and the fields keep their values.
    const ByteVector version2 = {0, 0, 2, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
    const auto b = buffer("keep.png", 0, 0.5f, 2.0f);
    QuickArchive ar(version2.data(), version2.size());
    EXPECT_FALSE(b->readFromArchive(ar));
    ASSERT_TRUE(ar.failure());
    EXPECT_NE(ar.failure()->reason.find("version"), std::string::npos) << ar.failure()->reason;
    EXPECT_TRUE(b->isEqual(buffer("keep.png", 0, 0.5f, 2.0f)));

    // A file name longer than the data that remains.
    const ByteVector longName = {0, 0, 1, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xFF, 0xFF, 0xFF, 0x7F, 'a'};
    QuickArchive ar2(longName.data(), longName.size());
    EXPECT_FALSE(b->readFromArchive(ar2));
    EXPECT_TRUE(ar2.failure());
}

TEST(BitmapXml, AssetText) {
    const auto b = buffer("C:\\Texturen\\Gr\xC3\xB6\xC3\x9F"
                          "e_\xE6\x9C\xA8.png",
                          BitmapBuffer::kSummedArea, 0.25f, 2.2f);
    std::string out;
    AssetXmlWriter writer(out);
    b->writeXml(writer, "/Oak/diffuse/buffer");
    EXPECT_EQ(writer.depth(), 0u);
    EXPECT_EQ(out, R"(  <Asset layout="" renderer="kavor" type="bitmap" url="/Oak/diffuse/buffer" >
    <plugin>
      <kavorplugin name="BitmapBuffer" type="bitmap">
        <parameters>
          <parameter type="integer" name="filter_type" listType="none" label="filter_type">
            <value>2</value>
          </parameter>
          <parameter type="float" name="filter_blur" listType="none" label="filter_blur">
            <value>0.25</value>
          </parameter>
          <parameter type="float" name="gamma" listType="none" label="gamma">
            <value>2.2</value>
          </parameter>
          <parameter type="string" name="file" listType="none" label="file">
            <value>C:\Texturen\Größe_木.png</value>
          </parameter>
        </parameters>
      </kavorplugin>
    </plugin>
  </Asset>
)");
}
