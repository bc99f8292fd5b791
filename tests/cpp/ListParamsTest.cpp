// List parameters and map channels: records of the stored lists, and walks through
// every list class as a renderer makes them.
#include "TestSupport.hpp"

#include <dexmor/params/GeomMapChannel.hpp>
#include <dexmor/params/NestedListParams.hpp>
#include <dexmor/params/SerialListParams.hpp>

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Record header of a stored list: version, element count, element size, block size.
Image listHeader(std::uint16_t version, std::uint32_t count, std::uint32_t size, std::uint32_t block) {
    return Image{}.version(0, version).u32(count).u32(size).u32(block);
}

class Plugin : public PluginBase {};

} // namespace

TEST(ListParams, IntegerListRecordImage) {
    DefSerialIntListParam faces("faces");
    faces.values() = {1, 2, 3};
    const ByteVector expected = listHeader(1, 3, 4, 12).i32(1).i32(2).i32(3).text("faces").bytes;
    EXPECT_EQ(recordOf(faces), expected);
    DefSerialIntListParam back("other");
    ASSERT_TRUE(readInto(back, expected));
    EXPECT_EQ(back.values(), faces.values());
    EXPECT_STREQ(back.getName(), "faces");
}

TEST(ListParams, VectorListRoundTrip) {
    DefSerialVectorListParam tverts("tverts"), back("x");
    tverts.values() = {{0.5f, 0.25f, 0}, {1, 0, -1}, {1e-6f, 3e7f, 2}};
    const ByteVector bytes = recordOf(tverts);
    EXPECT_EQ(ByteVector(bytes.begin(), bytes.begin() + 16), listHeader(1, 3, 12, 36).bytes);
    back.values() = {{9, 9, 9}};
    ASSERT_TRUE(readInto(back, bytes));
    EXPECT_EQ(back.values(), tverts.values());
    EXPECT_STREQ(back.getName(), "tverts");
}

TEST(ListParams, DamagedListRecordsAreRejected) {
    struct Case {
        const char* what;
        bool vectors;
        ByteVector bytes;
    };
    const Case cases[] = {
        {"version (0, 2)", false, listHeader(2, 0, 4, 0).text("f").bytes},
        {"vectors of 4 bytes", true, listHeader(1, 3, 4, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"integers of 12 bytes", false, listHeader(1, 1, 12, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"block shorter than the count", false, listHeader(1, 3, 4, 8).i32(1).i32(2).text("f").bytes},
        {"block longer than the count", false, listHeader(1, 2, 4, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"count beyond the data", false, listHeader(1, 0x40000000, 4, 0).bytes},
        {"count times size beyond 32 bits", true, listHeader(1, 0x20000000, 12, 0).bytes},
        {"name beyond the data", false, listHeader(1, 0, 4, 0).u32(99999).bytes},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        QuickArchive in(c.bytes.data(), c.bytes.size());
        DefSerialIntListParam ints("faces");
        DefSerialVectorListParam vectors("tverts");
        EXPECT_FALSE(c.vectors ? vectors.readFromArchive(in) : ints.readFromArchive(in));
        EXPECT_TRUE(in.failed());
        EXPECT_LE(ints.values().size() + vectors.values().size(), 3u);
    }
}

TEST(ListParams, WalkStringList) {
    DefStringListParam list("names", {"alpha", "b\xC3\xA9ta"});
    list.append("gamma");
    std::vector<std::string> seen;
    for (std::int32_t i = 0; i < list.elementCount(); ++i) seen.emplace_back(list.getString(i));
    EXPECT_EQ(seen, (std::vector<std::string>{"alpha", "b\xC3\xA9ta", "gamma"}));
    EXPECT_EQ(list.elementType(1), 9);
    EXPECT_EQ(list.getString(3), nullptr);
    EXPECT_EQ(list.getString(-1), nullptr);
    EXPECT_EQ(list.enterList(0), 0u);
    EXPECT_EQ(list.elementCount(), -1);
    list.leaveList(0);
    list.leaveList(0); // once too often
    EXPECT_EQ(list.elementCount(), 3);
}

TEST(ListParams, WalkPluginPairList) {
    Plugin diffuse, reflect;
    DefPluginPairListParam list("textures");
    list.addPair("diffuse", &diffuse);
    list.addPair("Reflect", &reflect);
    EXPECT_EQ(list.findByName("DIFFUSE"), &diffuse);
    EXPECT_EQ(list.findByName("reflect"), &reflect);
    EXPECT_EQ(list.findByName("diffus"), nullptr);
    EXPECT_EQ(list.getString(0), nullptr); // nothing entered
    EXPECT_EQ(list.elementType(0), 12);

    std::vector<std::pair<std::string, PluginBase*>> seen;
    for (std::int32_t i = 0; i < list.elementCount(); ++i) {
        const auto handle = list.enterList(i);
        EXPECT_EQ(handle, 1u);
        EXPECT_EQ(list.elementCount(), 2);
        EXPECT_EQ(list.elementType(0), 9);
        EXPECT_EQ(list.elementType(1), 10);
        EXPECT_EQ(list.getString(1), nullptr);
        seen.emplace_back(list.getString(0), list.getObject(1));
        list.leaveList(handle);
    }
    EXPECT_EQ(seen, (std::vector<std::pair<std::string, PluginBase*>>{{"diffuse", &diffuse}, {"Reflect", &reflect}}));

    EXPECT_EQ(list.enterList(7), 1u); // a pair past the end is empty
    EXPECT_EQ(list.getObject(1), nullptr);
    EXPECT_EQ(list.enterList(0), 0u); // nothing deeper than a pair
    EXPECT_EQ(list.elementCount(), -1);
    EXPECT_EQ(list.elementType(0), 10000);
    for (int i = 0; i < 3; ++i) list.leaveList(0);
    EXPECT_EQ(list.elementCount(), 2);
}

TEST(ListParams, WalkMultiMaterialSlots) {
    Plugin red, green, blue;
    DefMultiMtlParam slots("mtls_list");
    EXPECT_TRUE(slots.addEntry(&red, 0));
    EXPECT_TRUE(slots.addEntry(&green, 4));
    EXPECT_TRUE(slots.addEntry(&blue, 9));
    EXPECT_FALSE(slots.addEntry(&blue, -1));
    EXPECT_FALSE(slots.addEntry(nullptr, 2));
    EXPECT_EQ(slots.getInt(0), -1); // nothing entered

    std::vector<std::pair<std::int32_t, PluginBase*>> seen;
    for (std::int32_t i = 0; i < slots.elementCount(); ++i) {
        const auto handle = slots.enterList(i);
        EXPECT_EQ(handle, 0xDEADBEEFu);
        EXPECT_EQ(slots.elementCount(), 2) << "entry " << i; // every entry, not only entry 1
        EXPECT_EQ(slots.getInt(1), -1);
        seen.emplace_back(slots.getInt(0), slots.getObject(1));
        slots.leaveList(handle);
    }
    EXPECT_EQ(seen, (std::vector<std::pair<std::int32_t, PluginBase*>>{{0, &red}, {4, &green}, {9, &blue}}));

    const auto handle = slots.enterList(5); // past the end
    EXPECT_EQ(slots.getInt(0), -1);
    EXPECT_EQ(slots.getObject(1), nullptr);
    EXPECT_EQ(slots.enterList(1), 0u);
    EXPECT_EQ(slots.elementCount(), -1);
    slots.leaveList(0);
    slots.leaveList(handle);
    slots.leaveList(handle); // once too often
    EXPECT_EQ(slots.elementCount(), 3);
}

// --- map channels ---

namespace {

GeomMapChannelPtr channelOf(std::int32_t number, std::vector<std::int32_t> faces, std::vector<Vector> tverts) {
    auto channel = boost::make_shared<GeomMapChannel>(number);
    channel->setFaces(faces);
    channel->setTverts(tverts);
    return channel;
}

void addTwoChannels(DefGeomMapChannel& param) {
    param.addChannel(channelOf(1, {0, 1, 2}, {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}));
    param.addChannel(channelOf(7, {2, 1, 0, 0, 1, 2}, {{0.5f, 0.5f, 0}}));
}

} // namespace

TEST(GeomMapChannel, RecordWithoutTextureVerticesAndClone) {
    GeomMapChannel channel(2);
    channel.setFaces(std::vector<std::int32_t>{0, 1, 2, 2, 3, 0});
    const ByteVector record =
        Image{}.version(0, 1).i32(2).flag(true).append(recordOf(*channel.faces())).flag(false).bytes;
    GeomMapChannel back(9);
    ASSERT_TRUE(readInto(back, record));
    EXPECT_EQ(back.channel(), 2);
    ASSERT_NE(back.faces(), nullptr);
    EXPECT_EQ(back.faces()->values(), channel.faces()->values());
    EXPECT_EQ(back.tverts(), nullptr);
    EXPECT_EQ(recordOf(back), record);

    // A clone has lists of its own, present even where the original has none.
    const auto copy = back.clone();
    ASSERT_TRUE(copy && copy->faces() && copy->tverts());
    EXPECT_EQ(copy->channel(), 2);
    EXPECT_NE(copy->faces(), back.faces());
    EXPECT_EQ(copy->faces()->values(), back.faces()->values());
    back.setFaces(std::vector<std::int32_t>{});
    back.setTverts(std::vector<Vector>{{1, 1, 0}}); // creates the absent list
    EXPECT_EQ(copy->faces()->values().size(), 6u);
    EXPECT_STREQ(back.tverts()->getName(), "tverts");
}

TEST(GeomMapChannel, ChannelListRoundTripAndDamage) {
    DefGeomMapChannel param("map_channels"), back("x");
    addTwoChannels(param);
    EXPECT_FALSE(param.addChannel(GeomMapChannelPtr()));
    EXPECT_FALSE(param.channelAt(2));
    const ByteVector good = recordOf(param);
    back.addChannel(channelOf(4, {}, {})); // replaced by the read
    ASSERT_TRUE(readInto(back, good));
    EXPECT_EQ(back.name(), "map_channels");
    ASSERT_EQ(back.channelCount(), 2);
    EXPECT_EQ(back.channelAt(1)->channel(), 7);
    EXPECT_EQ(back.channelAt(1)->faces()->values(), param.channelAt(1)->faces()->values());
    EXPECT_EQ(recordOf(back), good);

    // A damaged second channel fails the read; the first is kept.
    ByteVector bytes = good;
    bytes[4 + 4 + 12 + 4 + recordOf(*param.channelAt(0)).size() + 2] = 9; // its version (0, 9)
    QuickArchive damaged(bytes.data(), bytes.size());
    EXPECT_FALSE(back.readFromArchive(damaged));
    EXPECT_EQ(back.channelCount(), 1);
    EXPECT_NE(damaged.failure()->recordPath.find("map channel 1"), std::string::npos);

    // A channel count beyond the data fails before anything is made.
    const ByteVector huge = Image{}.version(0, 1).u32(0).u32(0xFFFFFFFF).bytes;
    QuickArchive hugeIn(huge.data(), huge.size());
    EXPECT_FALSE(back.readFromArchive(hugeIn));
    EXPECT_EQ(back.channelCount(), 0);
}

TEST(GeomMapChannel, WalkAsARendererDoes) {
    DefGeomMapChannel param("map_channels");
    addTwoChannels(param);
    EXPECT_EQ(param.getInt(), 0); // nothing selected
    EXPECT_TRUE(param.getIntList().empty());

    struct Seen {
        std::int32_t channel;
        std::vector<Vector> tverts;
        std::vector<std::int32_t> faces;
    };
    std::vector<Seen> seen;
    for (std::int32_t c = 0; c < param.elementCount(); ++c) {
        const auto channelHandle = param.enterList(c);
        EXPECT_EQ(channelHandle, 0xDEAFBABEu);
        Seen s{param.getInt(0), {}, {}};
        const auto vertsHandle = param.enterList(1);
        for (std::int32_t i = 0; i < param.elementCount(); ++i) s.tverts.push_back(param.getVector(i));
        EXPECT_EQ(param.getVectorList().size(), s.tverts.size());
        param.leaveList(vertsHandle);
        param.enterList(2);
        const auto faces = param.getIntList();
        EXPECT_EQ(param.elementCount(), static_cast<std::int32_t>(faces.size()));
        s.faces.assign(faces.begin(), faces.end());
        param.leaveList(0xDEAFBABE);
        param.leaveList(channelHandle);
        seen.push_back(s);
    }
    ASSERT_EQ(seen.size(), 2u);
    EXPECT_EQ(seen[0].channel, 1);
    EXPECT_EQ(seen[0].tverts, (std::vector<Vector>{{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}));
    EXPECT_EQ(seen[1].channel, 7);
    EXPECT_EQ(seen[1].faces, (std::vector<std::int32_t>{2, 1, 0, 0, 1, 2}));

    // A channel past the end, then leaving too often.
    param.enterList(9);
    EXPECT_EQ(param.getInt(), 0);
    param.enterList(1);
    EXPECT_EQ(param.elementCount(), 0);
    EXPECT_EQ(param.getVector(0), Vector{});
    for (int i = 0; i < 3; ++i) param.leaveList(0);
    EXPECT_EQ(param.elementCount(), 2);
}
