// List parameters and map channels: records of the stored lists, and walks through
// every list class as a renderer makes them.
#include "TrimSupport.hpp"

#include <dexmor/params/GeomMapChannel.hpp>
#include <dexmor/params/NestedListParams.hpp>
#include <dexmor/params/SerialListParams.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Record header of a stored list: version, element count, element size, block size.
Image listHeader(std::uint16_t version, std::uint32_t count, std::uint32_t size, std::uint32_t block) {
    return Image{}.version(0, version).u32(count).u32(size).u32(block);
}

class Plugin : public PluginBase {};

} // namespace

TEST(ListParams, IntegerAndVectorListRecords) {
    DefSerialIntListParam faces("faces"), facesBack("other");
    faces.values() = {1, 2, 3};
    const ByteVector expected = listHeader(1, 3, 4, 12).i32(1).i32(2).i32(3).text("faces").bytes;
    EXPECT_EQ(recordOf(faces), expected);
    ASSERT_TRUE(readInto(facesBack, expected));
    EXPECT_EQ(facesBack.values(), faces.values());
    EXPECT_STREQ(facesBack.getName(), "faces");

    DefSerialVectorListParam tverts("tverts"), back("x");
    tverts.values() = {{0.5f, 0.25f, 0}, {1, 0, -1}, {1e-6f, 3e7f, 2}};
    const ByteVector bytes = recordOf(tverts);
    EXPECT_EQ(ByteVector(bytes.begin(), bytes.begin() + 16), listHeader(1, 3, 12, 36).bytes);
    back.values() = {{9, 9, 9}};
    ASSERT_TRUE(readInto(back, bytes));
    EXPECT_EQ(back.values(), tverts.values());
    EXPECT_STREQ(back.getName(), "tverts");
}

// (A vector count of four billion: HostileInputTest.)
TEST(ListParams, DamagedListRecordsAreRejected) {
    const std::tuple<const char*, bool, ByteVector> cases[] = {
        {"version (0, 2)", false, listHeader(2, 0, 4, 0).text("f").bytes},
        {"vectors of 4 bytes", true, listHeader(1, 3, 4, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"integers of 12 bytes", false, listHeader(1, 1, 12, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"block shorter than the count", false, listHeader(1, 3, 4, 8).i32(1).i32(2).text("f").bytes},
        {"block longer than the count", false, listHeader(1, 2, 4, 12).i32(1).i32(2).i32(3).text("f").bytes},
        {"count beyond the data", false, listHeader(1, 0x40000000, 4, 0).bytes},
        {"count times size beyond 32 bits", true, listHeader(1, 0x20000000, 12, 0).bytes},
        {"name beyond the data", false, listHeader(1, 0, 4, 0).u32(99999).bytes},
    };
    for (const auto& [what, vectors, bytes] : cases) {
        DefSerialIntListParam ints("faces");
        DefSerialVectorListParam tverts("tverts");
        QuickArchive ar;
        EXPECT_FALSE(vectors ? readInto(tverts, bytes, &ar) : readInto(ints, bytes, &ar)) << what;
        EXPECT_TRUE(ar.failed()) << what;
        EXPECT_LE(ints.values().size() + tverts.values().size(), 3u) << what;
    }
}

TEST(ListParams, WalkStringList) {
    DefStringListParam list("names", {"alpha", "b\xC3\xA9ta"});
    list.append("gamma");
    std::vector<std::string> seen;
    for (std::int32_t i = 0; i < list.elementCount(); ++i) seen.emplace_back(list.getString(i));
    EXPECT_EQ(seen, (std::vector<std::string>{"alpha", "b\xC3\xA9ta", "gamma"}));
    EXPECT_TRUE(list.elementType(1) == 9 && list.getString(3) == nullptr && list.getString(-1) == nullptr);
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
    EXPECT_TRUE(list.findByName("DIFFUSE") == &diffuse && list.findByName("reflect") == &reflect);
    EXPECT_EQ(list.findByName("diffus"), nullptr);
    EXPECT_EQ(list.getString(0), nullptr); // nothing entered
    EXPECT_EQ(list.elementType(0), 12);

    std::vector<std::pair<std::string, PluginBase*>> seen;
    for (std::int32_t i = 0; i < list.elementCount(); ++i) {
        const auto handle = list.enterList(i);
        EXPECT_TRUE(handle == 1u && list.elementCount() == 2 && list.getString(1) == nullptr);
        EXPECT_TRUE(list.elementType(0) == 9 && list.elementType(1) == 10);
        seen.emplace_back(list.getString(0), list.getObject(1));
        list.leaveList(handle);
    }
    EXPECT_EQ(seen, (std::vector<std::pair<std::string, PluginBase*>>{{"diffuse", &diffuse}, {"Reflect", &reflect}}));

    EXPECT_EQ(list.enterList(7), 1u); // a pair past the end is empty
    EXPECT_EQ(list.getObject(1), nullptr);
    EXPECT_EQ(list.enterList(0), 0u); // nothing deeper than a pair
    EXPECT_TRUE(list.elementCount() == -1 && list.elementType(0) == 10000);
    for (int i = 0; i < 3; ++i) list.leaveList(0);
    EXPECT_EQ(list.elementCount(), 2);
}

TEST(ListParams, WalkMultiMaterialSlots) {
    Plugin red, green, blue;
    DefMultiMtlParam slots("mtls_list");
    EXPECT_TRUE(slots.addEntry(&red, 0) && slots.addEntry(&green, 4) && slots.addEntry(&blue, 9));
    EXPECT_FALSE(slots.addEntry(&blue, -1) || slots.addEntry(nullptr, 2));
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
    EXPECT_TRUE(slots.getInt(0) == -1 && slots.getObject(1) == nullptr);
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
    EXPECT_TRUE(back.channel() == 2 && back.faces() && back.tverts() == nullptr);
    EXPECT_EQ(back.faces()->values(), channel.faces()->values());
    EXPECT_EQ(recordOf(back), record);

    // A clone has lists of its own, present even where the original has none.
    const auto copy = back.clone();
    ASSERT_TRUE(copy && copy->faces() && copy->tverts());
    EXPECT_TRUE(copy->channel() == 2 && copy->faces() != back.faces());
    back.setFaces(std::vector<std::int32_t>{});
    back.setTverts(std::vector<Vector>{{1, 1, 0}}); // creates the absent list
    EXPECT_EQ(copy->faces()->values().size(), 6u);
    EXPECT_STREQ(back.tverts()->getName(), "tverts");
}

// (A damaged list inside a channel, with its place: HostileInputTest.)
TEST(GeomMapChannel, ChannelListRoundTripAndDamage) {
    DefGeomMapChannel param("map_channels"), back("x");
    addTwoChannels(param);
    EXPECT_FALSE(param.addChannel(GeomMapChannelPtr()));
    EXPECT_FALSE(param.channelAt(2));
    const ByteVector good = recordOf(param);
    back.addChannel(channelOf(4, {}, {})); // replaced by the read
    ASSERT_TRUE(readInto(back, good));
    EXPECT_TRUE(back.name() == "map_channels" && back.channelCount() == 2 && back.channelAt(1)->channel() == 7);
    EXPECT_EQ(back.channelAt(1)->faces()->values(), param.channelAt(1)->faces()->values());
    EXPECT_EQ(recordOf(back), good);

    // A damaged second channel fails the read; the first is kept.
    expectReadFails(back, withVersion(good, 0, 9, 4 + 4 + 12 + 4 + recordOf(*param.channelAt(0)).size()),
                    "map channel 1");
    EXPECT_EQ(back.channelCount(), 1);
    // A channel count beyond the data fails before anything is made.
    EXPECT_FALSE(readInto(back, Image{}.version(0, 1).u32(0).u32(0xFFFFFFFF).bytes));
    EXPECT_EQ(back.channelCount(), 0);
}

TEST(GeomMapChannel, WalkAsARendererDoes) {
    DefGeomMapChannel param("map_channels");
    addTwoChannels(param);
    EXPECT_TRUE(param.getInt() == 0 && param.getIntList().empty()); // nothing selected

    std::vector<std::pair<std::int32_t, std::vector<Vector>>> verts;
    std::vector<std::vector<std::int32_t>> faces;
    for (std::int32_t c = 0; c < param.elementCount(); ++c) {
        const auto channelHandle = param.enterList(c);
        EXPECT_EQ(channelHandle, 0xDEAFBABEu);
        verts.emplace_back(param.getInt(0), std::vector<Vector>{});
        const auto vertsHandle = param.enterList(1);
        for (std::int32_t i = 0; i < param.elementCount(); ++i) verts.back().second.push_back(param.getVector(i));
        EXPECT_EQ(param.getVectorList().size(), verts.back().second.size());
        param.leaveList(vertsHandle);
        param.enterList(2);
        const auto list = param.getIntList();
        EXPECT_EQ(param.elementCount(), static_cast<std::int32_t>(list.size()));
        faces.emplace_back(list.begin(), list.end());
        param.leaveList(0xDEAFBABE);
        param.leaveList(channelHandle);
    }
    ASSERT_EQ(verts.size(), 2u);
    EXPECT_EQ(verts[0], std::pair(1, std::vector<Vector>{{0, 0, 0}, {1, 0, 0}, {0, 1, 0}}));
    EXPECT_EQ(verts[1].first, 7);
    EXPECT_EQ(faces[1], (std::vector<std::int32_t>{2, 1, 0, 0, 1, 2}));

    // A channel past the end, then leaving too often.
    param.enterList(9);
    EXPECT_EQ(param.getInt(), 0);
    param.enterList(1);
    EXPECT_TRUE(param.elementCount() == 0 && param.getVector(0) == Vector{});
    for (int i = 0; i < 3; ++i) param.leaveList(0);
    EXPECT_EQ(param.elementCount(), 2);
}
