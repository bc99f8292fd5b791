// Keyed values, the animated parameters that present them to the renderer, and
// their use in record tables.
#include "TestSupport.hpp"

#include <dexmor/archive/Record.hpp>
#include <dexmor/params/AnimatedParams.hpp>
#include <dexmor/params/AnimatedValues.hpp>

#include <gtest/gtest.h>

#include <array>
#include <limits>
#include <vector>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

using ByteVec = ByteVector;
constexpr double kInf = std::numeric_limits<double>::infinity();
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

// Byte images of records, assembled by hand.
struct Bytes {
    Bytes() = default;
    QuickArchive ar;
    template <class T>
    Bytes& add(const T& v) {
        ar.write(v);
        return *this;
    }
    Bytes& version(std::uint16_t a, std::uint16_t b) { return add(VersionWord::make(a, b)); }
    Bytes& string(const std::string& s) {
        ar.writeString(s);
        return *this;
    }
    // Key count and time size of a keyed record.
    Bytes& keys(std::uint32_t count, std::uint32_t timeSize = 8) { return add(count).add(timeSize); }
    operator ByteVec() const { return bytesOf(ar); }
};

QuickArchive over(const ByteVec& b) { return QuickArchive(b.data(), b.size()); }

Transform moved(float x, float y, float z) { return Transform{Matrix::identity(), Vector{x, y, z}}; }
Transform scaled(float s) { return Transform{Matrix{{{s, 0, 0}, {0, s, 0}, {0, 0, s}}}, Vector{}}; }

// Writes, reads into `back`, and checks that `back` writes the same bytes.
template <class T>
ByteVec roundTrip(T& object, T& back) {
    QuickArchive ar;
    EXPECT_TRUE(object.writeToArchive(ar));
    const ByteVec bytes = bytesOf(ar);
    QuickArchive in = over(bytes);
    EXPECT_TRUE(back.readFromArchive(in)) << (in.failed() ? in.failure()->describe() : "");
    QuickArchive again;
    back.writeToArchive(again);
    EXPECT_EQ(bytesOf(again), bytes);
    return bytes;
}

} // namespace

TEST(AnimatedValues, RealRecordImage) {
    AnimatedReal r;
    EXPECT_EQ(r.keyCount(), 1);
    r.setValue(2.5f, 10);
    QuickArchive ar;
    ASSERT_TRUE(r.writeToArchive(ar));
    const ByteVec expected = Bytes{}.version(0, 1).keys(2).add(true).add(0.0).add(0.0f).add(10.0).add(2.5f);
    EXPECT_EQ(bytesOf(ar), expected);
    EXPECT_EQ(ByteVec(expected.begin(), expected.begin() + 4), (ByteVec{0x00, 0x00, 0x01, 0x00}));
}

TEST(AnimatedValues, BlendingHoldingAndBeyondTheKeys) {
    AnimatedReal blend(true), hold(false);
    blend.setValue(2.5f, 10);
    hold.setValue(2.5f, 10);
    EXPECT_EQ(blend.valueAt(4), 1.0f);
    EXPECT_EQ(hold.valueAt(4), 0.0f);
    EXPECT_EQ(blend.valueAt(20), 2.5f);
    EXPECT_EQ(hold.valueAt(20), 2.5f);
    // Before the first key: its value, with no division by a zero time span.
    blend.setValue(7, -5);
    EXPECT_EQ(blend.valueAt(-6), 7.0f);
    EXPECT_EQ(blend.valueAt(-kInf), 7.0f);

    // Integers blend in double precision and truncate toward zero.
    AnimatedInt up, down;
    up.setValue(5, 10);
    down.setValue(-5, 10);
    EXPECT_EQ(up.valueAt(3), 1);    // 1.5
    EXPECT_EQ(down.valueAt(3), -1); // -1.5
    // The factor 1/3 is rounded to the float 0.33333334: 3e8 blends to 100000002.98.
    AnimatedInt big;
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
    r.setValue(3, 30);
    r.setValue(-1, -10);
    r.setValue(1, 10);
    r.setValue(2, 10); // overwrites
    r.setValue(9, kNaN); // cannot be ordered: ignored
    ASSERT_EQ(r.keyCount(), 4);
    const double times[] = {-10, 0, 10, 30};
    for (int i = 0; i < 4; ++i) EXPECT_EQ(r.keyTime(i), times[i]);
    EXPECT_EQ(r.keyTime(4), 0.0);
    EXPECT_EQ(r.keyTime(-1), 0.0);
    EXPECT_EQ(r.valueAt(10), 2.0f);
}

TEST(AnimatedValues, RecordsRoundTripWithSeveralKeys) {
    AnimatedInt i(false), iBack;
    i.setValue(-3, -2.5);
    i.setValue(12, 4);
    i.setValue(99, 1e6);
    roundTrip(i, iBack);
    EXPECT_EQ(iBack, i);

    AnimatedReal r, rBack(false);
    r.setValue(-7.5f, 3);
    r.setValue(1e-7f, 8.25);
    roundTrip(r, rBack);
    EXPECT_EQ(rBack, r);

    AnimatedTransform t, tBack;
    t.setValue(scaled(2), 1);
    t.setValue(moved(1, 2, 3), 2);
    EXPECT_EQ(roundTrip(t, tBack).size(), 12u + 3 * (8 + 48)); // no interpolate flag
    EXPECT_EQ(tBack, t);
}

TEST(AnimatedValues, ReadingStartsFromTheResetContainer) {
    // An integer record without a key at time 0 gains the default key.
    QuickArchive ints = over(Bytes{}.version(0, 1).keys(1).add(true).add(5.0).add(std::int32_t{40}));
    AnimatedInt i;
    i.setValue(77, 3);
    ASSERT_TRUE(i.readFromArchive(ints));
    ASSERT_EQ(i.keyCount(), 2);
    EXPECT_EQ(i.valueAt(0), 0);
    EXPECT_EQ(i.valueAt(5), 40);

    // A transform record holds exactly its keys, and may hold none.
    QuickArchive later = over(Bytes{}.version(0, 1).keys(2).add(5.0).add(moved(1, 0, 0)).add(10.0).add(moved(3, 0, 0)));
    AnimatedTransform t;
    ASSERT_TRUE(t.readFromArchive(later));
    EXPECT_EQ(t.keyCount(), 2);
    EXPECT_EQ(t.valueAt(0), moved(1, 0, 0));
    EXPECT_EQ(t.valueAt(7.5), moved(2, 0, 0));
    QuickArchive none = over(Bytes{}.version(0, 1).keys(0));
    ASSERT_TRUE(t.readFromArchive(none));
    EXPECT_EQ(t.keyCount(), 0);
    EXPECT_EQ(t.valueAt(12), Transform::identity());

    // Infinite key times read; the blend between -inf and 0 holds the earlier value.
    QuickArchive inf = over(Bytes{}.version(0, 1).keys(2).add(true).add(-kInf).add(std::int32_t{7}).add(kInf).add(std::int32_t{9}));
    ASSERT_TRUE(i.readFromArchive(inf));
    EXPECT_EQ(i.valueAt(-1), 7);
    EXPECT_EQ(i.valueAt(1), 0);
    EXPECT_EQ(i.valueAt(kInf), 9);
}

TEST(AnimatedValues, DamagedRecordsAreRejected) {
    const std::pair<const char*, ByteVec> cases[] = {
        {"version (1, 1)", Bytes{}.version(1, 1).keys(0).add(true)},
        {"version (0, 2)", Bytes{}.version(0, 2).keys(0).add(true)},
        {"time size 4", Bytes{}.version(0, 1).keys(1, 4).add(true)},
        {"more keys than bytes", Bytes{}.version(0, 1).keys(0xFFFFFFFF).add(true).add(1.0).add(2.0f)},
        {"key time not a number", Bytes{}.version(0, 1).keys(1).add(true).add(kNaN).add(2.0f)},
    };
    for (const auto& [what, bytes] : cases) {
        SCOPED_TRACE(what);
        QuickArchive in = over(bytes);
        AnimatedReal r;
        r.setValue(5, 5);
        EXPECT_FALSE(r.readFromArchive(in));
        ASSERT_TRUE(in.failed());
        EXPECT_EQ(r, AnimatedReal{}); // left reset
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

// Version 1 stored plain values, version 2 the containers' records.
constexpr std::array kHolderFields = {
    record::fieldAs<record::AnimatedPlainValue, &Holder::focal>("focal", record::between(1, 1)),
    record::field<&Holder::focal>("focal", record::since(2)),
    record::fieldAs<record::AnimatedPlainValue, &Holder::placement>("placement", record::between(1, 1)),
    record::field<&Holder::placement>("placement", record::since(2)),
    record::fieldAs<record::AnimatedPlainValue, &Holder::count>("count", record::between(1, 1)),
    record::field<&Holder::count>("count", record::since(2)),
};

} // namespace

TEST(AnimatedValues, RecordTablesStoreContainersAndOldPlainValues) {
    const ByteVec old = Bytes{}.add(40.0f).add(moved(1, 2, 3)).add(std::int32_t{6});
    QuickArchive in = over(old);
    Holder h;
    ASSERT_TRUE(record::readFields(in, h, kHolderFields, 1));
    EXPECT_EQ(h.focal.keyCount(), 1);
    EXPECT_EQ(h.focal.valueAt(0), 40.0f);
    EXPECT_EQ(h.placement.valueAt(0), moved(1, 2, 3));
    EXPECT_EQ(h.count.valueAt(0), 6);

    h.focal.setValue(80.0f, 24);
    h.placement.setValue(scaled(2), 10);
    QuickArchive ar;
    ASSERT_TRUE(record::writeFields(ar, h, kHolderFields, 2));
    QuickArchive in2 = over(bytesOf(ar));
    Holder back;
    ASSERT_TRUE(record::readFields(in2, back, kHolderFields, 2));
    EXPECT_TRUE(record::fieldsEqual(h, back, kHolderFields));
    back.focal.setValue(81.0f, 24);
    EXPECT_STREQ(record::firstDifference(h, back, kHolderFields), "focal");

    // The old form stores the values at time 0.
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
    EXPECT_TRUE(real.setFloat(2.5f, 0, 10));
    EXPECT_TRUE(real.setDouble(5.0, 0, 20));
    EXPECT_EQ(real.getFloat(0, 4), 1.0f);
    EXPECT_EQ(real.getDouble(0, 15), 3.75);
    EXPECT_FALSE(real.setInt(1)); // not its type

    PluginInterface* iface = real.getInterface(PluginBase::interfaceId(0xDED00001u, 0xBABAu));
    ASSERT_NE(iface, nullptr);
    EXPECT_EQ(iface->getInterfaceId(), 0xBABADED00001ull);
    EXPECT_STREQ(iface->getInterfaceName(), "EXT_INTERPOLATING");
    auto* interp = dynamic_cast<MyInterpolatingInterface*>(iface);
    ASSERT_NE(interp, nullptr);
    EXPECT_EQ(interp->keyCount(), 3);
    EXPECT_EQ(interp->keyTime(2), 20.0);
    EXPECT_EQ(interp->interpolationType(), 0);
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
    i.setInt(4, 0, 1);
    i.setInt(-9, 0, 2);
    EXPECT_EQ(roundTrip(i, iBack)[2], 1);
    EXPECT_EQ(iBack.name(), "subdivs");
    EXPECT_EQ(iBack.value(), i.value());
    DefAnimRealParam r("focal_length"), rBack("x");
    r.setFloat(85, 0, 48);
    roundTrip(r, rBack);
    EXPECT_EQ(rBack.value(), r.value());

    // Transform version 1 stores the keys without a container record; they land on
    // the reset container, whose identity at time 0 stays.
    QuickArchive in =
        over(Bytes{}.version(0, 1).string("transform").keys(2).add(5.0).add(moved(1, 1, 1)).add(10.0).add(scaled(3)));
    DefAnimTransformParam t("x"), tBack("y");
    ASSERT_TRUE(t.readFromArchive(in));
    EXPECT_EQ(t.name(), "transform");
    ASSERT_EQ(t.keyCount(), 3);
    EXPECT_EQ(t.getTransform(0, 0), Transform::identity());
    EXPECT_EQ(t.getTransform(0, 5), moved(1, 1, 1));
    EXPECT_EQ(t.getTransform(0, 10), scaled(3));
    EXPECT_EQ(roundTrip(t, tBack)[2], 2); // written back as version 2
    EXPECT_EQ(tBack.value(), t.value());
}

TEST(AnimatedParams, DamagedRecordsAreRejected) {
    const std::pair<const char*, ByteVec> cases[] = {
        {"version (0, 3)", Bytes{}.version(0, 3).string("t")},
        {"version 1, time size 16", Bytes{}.version(0, 1).string("t").keys(1, 16)},
        {"version 1, more keys than bytes", Bytes{}.version(0, 1).string("t").keys(100000).add(1.0)},
        {"version 2, damaged container", Bytes{}.version(0, 2).string("t").version(0, 1).keys(1, 4)},
        {"name beyond the data", Bytes{}.version(0, 2).add(std::uint32_t{5000})},
    };
    for (const auto& [what, bytes] : cases) {
        SCOPED_TRACE(what);
        QuickArchive in = over(bytes);
        DefAnimTransformParam t("t");
        EXPECT_FALSE(t.readFromArchive(in));
        EXPECT_TRUE(in.failed());
    }
    QuickArchive in = over(Bytes{}.version(0, 2).string("r")); // the real parameter knows only version 1
    DefAnimRealParam r("r");
    EXPECT_FALSE(r.readFromArchive(in));
}
