// The renderer's parameter interface: extension interfaces and the typed lists.
// (The plain interface's neutral answers are constants of its declaration.)
#include <dexmor/params/PluginParameter.hpp>

#include <gtest/gtest.h>

#include <vector>

using namespace OrvexKavorCore;
using namespace KavorUtils;

namespace {

class PlainParam : public KavorPluginParameter {
public:
    const char* getName() const override { return "plain"; }
};

class FakeInterface : public PluginInterface {
public:
    explicit FakeInterface(std::uint64_t id) : id_(id) {}
    std::uint64_t getInterfaceId() const override { return id_; }
    const char* getInterfaceName() const override { return "EXT_FAKE"; }

private:
    std::uint64_t id_;
};

} // namespace

TEST(ParamInterface, ExtensionInterfacesAreFoundByIdLatestFirst) {
    PlainParam p;
    FakeInterface first(0x1234500000001ull), second(0x1234500000001ull), other(7);
    int tag = 0;
    EXPECT_TRUE(p.registerInterface(&first, &tag));
    EXPECT_TRUE(p.registerInterface(nullptr)); // holds a node, never found
    EXPECT_TRUE(p.registerInterface(&other));
    EXPECT_EQ(p.getInterface(0x1234500000001ull), &first);
    EXPECT_EQ(p.interfaceData(&first), &tag);
    EXPECT_TRUE(p.registerInterface(&second));
    EXPECT_EQ(p.getInterface(0x1234500000001ull), &second);
    EXPECT_EQ(p.getInterface(7), &other);
    EXPECT_EQ(p.getInterface(8), nullptr);

    EXPECT_TRUE(p.unregisterInterface(&second));
    EXPECT_EQ(p.getInterface(0x1234500000001ull), &first);
    EXPECT_FALSE(p.unregisterInterface(&second));
    EXPECT_TRUE(p.unregisterInterface(&first)); // behind two other nodes
    EXPECT_EQ(p.getInterface(0x1234500000001ull), nullptr);
    EXPECT_EQ(p.getInterface(7), &other);
    // The remaining nodes go with the object (checked under LeakSanitizer).
}

TEST(ParamInterface, IntegerAndVectorLists) {
    DefIntListParam ints("faces");
    EXPECT_EQ(ints.elementType(), 0);
    const std::vector<std::int32_t> faceData{4, -5, 6};
    ints.setValues(faceData);
    EXPECT_EQ(ints.elementCount(), 3);
    EXPECT_TRUE(ints.getInt(1) == -5 && ints.getInt(3) == 0 && ints.getInt(-1) == 0);
    const auto view = ints.getIntList();
    EXPECT_EQ(std::vector<std::int32_t>(view.begin(), view.end()), faceData);

    DefVectorListParam verts("tverts");
    EXPECT_EQ(verts.elementType(), 4);
    verts.values() = {{1, 2, 3}, {4, 5, 6}};
    EXPECT_TRUE(verts.getVector(1) == (Vector{4, 5, 6}) && verts.getVector(2) == Vector{});
    EXPECT_TRUE(verts.getVectorList().size() == 2u && verts.getIntList().empty());

    // Entering only counts the depth, which never goes below zero.
    ints.leaveList(0);
    ints.enterList(0);
    ints.enterList(0);
    EXPECT_EQ(ints.depth(), 2);
    for (int i = 0; i < 3; ++i) ints.leaveList(0);
    EXPECT_EQ(ints.depth(), 0);
}
