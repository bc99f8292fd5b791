// Keyed values, the animated parameters that present them to the renderer, and
// their use in record tables.
#include "TrimSupport.hpp"

#include <dexmor/archive/Record.hpp>
#include <dexmor/params/AnimatedParams.hpp>
#include <dexmor/params/AnimatedValues.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

constexpr double kInf = std::numeric_limits<double>::infinity();
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// A keyed record's head: version, key count and time size.
Image keyed(std::uint32_t count, std::uint32_t timeSize = 8, std::uint16_t version = 1) {
    return Image{}.version(0, version).u32(count).u32(timeSize);
}

Transform moved(float x, float y, float z) { return Transform{Matrix::identity(), Vector{x, y, z}}; }
Transform scaled(float s) { return Transform{Matrix{{{s, 0, 0}, {0, s, 0}, {0, 0, s}}}, Vector{}}; }

// Writes, reads into `back`, and checks that `back` writes the same bytes.
template <class T>
ByteVector roundTrip(T& object, T& back) {
    const ByteVector bytes = recordOf(object);
    QuickArchive ar;
    EXPECT_TRUE(readInto(back, bytes, &ar)) << failureOf(ar);
    EXPECT_EQ(recordOf(back), bytes);
    return bytes;
}

} // namespace

TEST(AnimatedValues, BlendingHoldingAndBeyondTheKeys) {
    AnimatedReal blend(true), hold(false);
    blend.setValue(2.5f, 10);
    hold.setValue(2.5f, 10);
    EXPECT_TRUE(blend.valueAt(4) == 1.0f && hold.valueAt(4) == 0.0f);
    EXPECT_TRUE(blend.valueAt(20) == 2.5f && hold.valueAt(20) == 2.5f);
    // Before the first key: its value, with no division by a zero time span.
    blend.setValue(7, -5);
    EXPECT_TRUE(blend.valueAt(-6) == 7.0f && blend.valueAt(-kInf) == 7.0f);

    // Integers blend in double precision and truncate toward zero (1.5, -1.5).
    AnimatedInt up, down, big;
    up.setValue(5, 10), down.setValue(-5, 10);
    EXPECT_TRUE(up.valueAt(3) == 1 && down.valueAt(3) == -1);
    // The factor 1/3 is rounded to the float 0.33333334: 3e8 blends to 100000002.98.
    big.setValue(300000000, 3);
    EXPECT_EQ(big.valueAt(1), 100000002);

    // Transforms blend each of the twelve numbers.
    AnimatedTransform t;
    t.setValue(moved(0, 10, -4), 0);
    Transform end = scaled(3);
    end.m[2].x = 8;
    end.offs = Vector{4, 10, 4};
    t.setValue(end, 2);
    const Transform quarter = t.valueAt(0.5);
    EXPECT_EQ(quarter.m, (Matrix{{{1.5f, 0, 0}, {0, 1.5f, 0}, {2, 0, 1.5f}}}));
    EXPECT_EQ(quarter.offs, (Vector{1, 10, -2}));
}

TEST(AnimatedValues, KeysStayOrderedAndUnique) {
    AnimatedReal r;
    r.setValue(3, 30), r.setValue(-1, -10), r.setValue(1, 10);
    r.setValue(2, 10);   // overwrites
    r.setValue(9, kNaN); // cannot be ordered: ignored
    ASSERT_EQ(r.keyCount(), 4);
    EXPECT_EQ((std::array{r.keyTime(0), r.keyTime(1), r.keyTime(2), r.keyTime(3)}),
              (std::array{-10.0, 0.0, 10.0, 30.0}));
    EXPECT_TRUE(r.keyTime(4) == 0.0 && r.keyTime(-1) == 0.0 && r.valueAt(10) == 2.0f);
}

TEST(AnimatedValues, RecordsRoundTripWithSeveralKeys) {
    // A new value holds the key (0, 0); the interpolate flag stands before the keys.
    AnimatedReal image;
    image.setValue(2.5f, 10);
    EXPECT_EQ(recordOf(image), keyed(2).flag(true).f64(0).f32({0}).f64(10).f32({2.5f}).bytes);
    AnimatedInt i(false), iBack;
    i.setValue(-3, -2.5), i.setValue(12, 4), i.setValue(99, 1e6);
    roundTrip(i, iBack);
    EXPECT_EQ(iBack, i);
    AnimatedReal r, rBack(false);
    r.setValue(-7.5f, 3), r.setValue(1e-7f, 8.25);
    roundTrip(r, rBack);
    EXPECT_EQ(rBack, r);
    AnimatedTransform t, tBack;
    t.setValue(scaled(2), 1), t.setValue(moved(1, 2, 3), 2);
    EXPECT_EQ(roundTrip(t, tBack).size(), 12u + 3 * (8 + 48)); // no interpolate flag
    EXPECT_EQ(tBack, t);
}

TEST(AnimatedValues, ReadingStartsFromTheResetContainer) {
    // An integer record without a key at time 0 gains the default key.
    AnimatedInt i;
    i.setValue(77, 3);
    ASSERT_TRUE(readInto(i, keyed(1).flag(true).f64(5).i32(40).bytes));
    EXPECT_TRUE(i.keyCount() == 2 && i.valueAt(0) == 0 && i.valueAt(5) == 40);

    // A transform record holds exactly its keys, and may hold none.
    AnimatedTransform t;
    ASSERT_TRUE(readInto(t, keyed(2).f64(5).put(moved(1, 0, 0)).f64(10).put(moved(3, 0, 0)).bytes));
    EXPECT_TRUE(t.keyCount() == 2 && t.valueAt(0) == moved(1, 0, 0) && t.valueAt(7.5) == moved(2, 0, 0));
    ASSERT_TRUE(readInto(t, keyed(0).bytes));
    EXPECT_TRUE(t.keyCount() == 0 && t.valueAt(12) == Transform::identity());

    // Infinite key times read; the blend between -inf and 0 holds the earlier value.
    ASSERT_TRUE(readInto(i, keyed(2).flag(true).f64(-kInf).i32(7).f64(kInf).i32(9).bytes));
    EXPECT_TRUE(i.valueAt(-1) == 7 && i.valueAt(1) == 0 && i.valueAt(kInf) == 9);
}

// (Key counts beyond the data, key times of 4 bytes or not a number: HostileInputTest.)
TEST(AnimatedValues, OtherVersionsAreRejectedAndLeaveTheResetContainer) {
    for (const Image& image : {Image{}.version(1, 1).u32(0).u32(8).flag(true), keyed(0, 8, 2).flag(true)}) {
        AnimatedReal r;
        r.setValue(5, 5);
        EXPECT_FALSE(readInto(r, image.bytes));
        EXPECT_EQ(r, AnimatedReal{});
    }
}

TEST(AnimatedValues, ComparisonLooksAtEveryKeyAndTheBlendFlag) {
    auto real = [](bool interpolate, float v, double t) {
        AnimatedReal r(interpolate);
        r.setValue(v, t);
        return r;
    };
    EXPECT_EQ(real(true, 1, 5), real(true, 1, 5));
    EXPECT_FALSE(real(true, 1, 5) == real(true, 1, 6));
    EXPECT_FALSE(real(true, 1, 5) == real(true, 1.5f, 5));
    EXPECT_FALSE(real(true, 1, 5) == real(false, 1, 5));
    EXPECT_FALSE(real(true, 1, 0) == AnimatedReal{}); // one key each, different values
}

namespace {

struct Holder {
    AnimatedReal focal{true};
    AnimatedTransform placement;
    AnimatedInt count{false};
};

// Version 1 stored plain values (later versions the containers' records: the light
// and camera records).
constexpr std::array kHolderFields = {
    record::fieldAs<record::AnimatedPlainValue, &Holder::focal>("focal", record::between(1, 1)),
    record::fieldAs<record::AnimatedPlainValue, &Holder::placement>("placement", record::between(1, 1)),
    record::fieldAs<record::AnimatedPlainValue, &Holder::count>("count", record::between(1, 1)),
};

} // namespace

TEST(AnimatedValues, RecordTablesStoreOldPlainValues) {
    const ByteVector old = Image{}.f32({40}).put(moved(1, 2, 3)).i32(6).bytes;
    QuickArchive in(old.data(), old.size());
    Holder h;
    ASSERT_TRUE(record::readFields(in, h, kHolderFields, 1));
    EXPECT_TRUE(h.focal.keyCount() == 1 && h.focal.valueAt(0) == 40.0f);
    EXPECT_TRUE(h.placement.valueAt(0) == moved(1, 2, 3) && h.count.valueAt(0) == 6);

    // The old form stores the values at time 0.
    h.focal.setValue(80.0f, 24);
    h.placement.setValue(scaled(2), 10);
    QuickArchive plain;
    ASSERT_TRUE(record::writeFields(plain, h, kHolderFields, 1));
    EXPECT_EQ(bytesOf(plain), old);
    // A plain value missing at the end of the data keeps the earlier value.
    QuickArchive empty(nullptr, 0);
    EXPECT_TRUE(record::AnimatedPlainValue::read(empty, h.focal));
    EXPECT_EQ(h.focal.valueAt(0), 40.0f);
}

// --- animated parameters ---

TEST(AnimatedParams, InterpolatingInterfaceAndValuesAtATime) {
    using KavorUtils::MyInterpolatingInterface;
    DefAnimRealParam real("focal_length");
    EXPECT_TRUE(real.setFloat(2.5f, 0, 10) && real.setDouble(5.0, 0, 20));
    EXPECT_TRUE(real.getFloat(0, 4) == 1.0f && real.getDouble(0, 15) == 3.75);
    EXPECT_FALSE(real.setInt(1)); // not its type

    PluginInterface* iface = real.getInterface(PluginBase::interfaceId(0xDED00001u, 0xBABAu));
    ASSERT_NE(iface, nullptr);
    EXPECT_EQ(iface->getInterfaceId(), 0xBABADED00001ull);
    EXPECT_STREQ(iface->getInterfaceName(), "EXT_INTERPOLATING");
    auto* interp = dynamic_cast<MyInterpolatingInterface*>(iface);
    ASSERT_NE(interp, nullptr);
    EXPECT_TRUE(interp->keyCount() == 3 && interp->keyTime(2) == 20.0 && interp->interpolationType() == 0);
    EXPECT_EQ(real.getInterface(0xBABADED00002ull), nullptr);

    DefAnimIntParam held("steps", AnimatedInt(false)); // copies the container
    held.setInt(8, 0, 4);
    EXPECT_EQ(held.getInt(0, 3), 0);
    EXPECT_EQ(dynamic_cast<MyInterpolatingInterface*>(held.getInterface(0xBABADED00001ull))->interpolationType(), 1);
    DefAnimTransformParam placement("transform");
    placement.setTransform(moved(0, 0, 8), 0, 2);
    EXPECT_EQ(placement.getTransform(0, 1), moved(0, 0, 4));
}

TEST(AnimatedParams, RecordsOfEveryVersion) {
    DefAnimIntParam i("subdivs", AnimatedInt(false)), iBack("x");
    i.setInt(4, 0, 1), i.setInt(-9, 0, 2);
    EXPECT_EQ(roundTrip(i, iBack)[2], 1);
    EXPECT_TRUE(iBack.name() == "subdivs" && iBack.value() == i.value());
    DefAnimRealParam r("focal_length"), rBack("x");
    r.setFloat(85, 0, 48);
    roundTrip(r, rBack);
    EXPECT_EQ(rBack.value(), r.value());

    // Transform version 1 stores the keys without a container record; they land on
    // the reset container, whose identity at time 0 stays.
    DefAnimTransformParam t("x"), tBack("y");
    ASSERT_TRUE(readInto(t, Image{}.version(0, 1).text("transform").u32(2).u32(8).f64(5).put(moved(1, 1, 1)).f64(10)
                                .put(scaled(3)).bytes));
    EXPECT_TRUE(t.name() == "transform" && t.keyCount() == 3);
    EXPECT_EQ(t.getTransform(0, 0), Transform::identity());
    EXPECT_TRUE(t.getTransform(0, 5) == moved(1, 1, 1) && t.getTransform(0, 10) == scaled(3));
    EXPECT_EQ(roundTrip(t, tBack)[2], 2); // written back as version 2
    EXPECT_EQ(tBack.value(), t.value());
}

TEST(AnimatedParams, DamagedRecordsAreRejected) {
    const std::pair<const char*, ByteVector> cases[] = {
        {"version (0, 3)", Image{}.version(0, 3).text("t").bytes},
        {"version 1, time size 16", Image{}.version(0, 1).text("t").u32(1).u32(16).bytes},
        {"version 1, more keys than bytes", Image{}.version(0, 1).text("t").u32(100000).u32(8).f64(1).bytes},
        {"version 2, damaged container", Image{}.version(0, 2).text("t").append(keyed(1, 4).bytes).bytes},
        {"name beyond the data", Image{}.version(0, 2).u32(5000).bytes},
    };
    for (const auto& [what, bytes] : cases) {
        DefAnimTransformParam t("t");
        EXPECT_FALSE(readInto(t, bytes)) << what;
    }
    DefAnimRealParam r("r"); // the real parameter knows only version 1
    EXPECT_FALSE(readInto(r, Image{}.version(0, 2).text("r").bytes));
}
