// Transform components: their record, the matrices built from them, comparison.
#include "TrimSupport.hpp"

#include <dexmor/params/TransformComponents.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace KavorUtils {
void PrintTo(const Matrix& m, std::ostream* os) {
    for (const Vector& c : m.m) *os << "(" << c.x << ", " << c.y << ", " << c.z << ") ";
}
} // namespace KavorUtils

namespace {

template <class Set>
Matrix built(Set set) {
    TransformComponents c;
    set(c);
    return c.buildMatrix();
}

// Rounded 32-bit values of the angles used below (angle × float(pi / 180), then
// double cosine and sine rounded to 32 bits).
constexpr float kCos90 = -0x1.777a5cp-25f; // -4.371139e-08
constexpr float kCos30 = 0x1.bb67aep-1f;
constexpr float kSin30 = 0.5f;
constexpr float kSin180 = -0x1.777a5cp-24f;

} // namespace

// (Every field takes part in comparison: the UVW generators' byte flips.)
TEST(TransformComponents, RecordLayoutRoundTripAndVersion) {
    TransformComponents c;
    c.y_rotation = 30.5f, c.x_scale = 2, c.z_offset = 7, c.x_mirror = 1, c.z_mirror = -3;
    const ByteVector bytes = recordOf(c);
    EXPECT_EQ(bytes, Image{}.version(0, 1).f32({0, 30.5f, 0, 2, 1, 1, 0, 0, 7}).i32(1).i32(0).i32(-3).bytes);
    TransformComponents back;
    ASSERT_TRUE(readInto(back, bytes));
    EXPECT_EQ(back, c);
    // Another version fails and leaves the defaults.
    EXPECT_FALSE(readInto(back, withVersion(bytes, 0, 2)));
    EXPECT_EQ(back, TransformComponents{});
}

TEST(TransformComponents, SingleRotationsMirrorsAndScales) {
    using M = Matrix;
    EXPECT_EQ(built([](auto& c) { c.z_rotation = 90; }), (M{{{kCos90, 1, 0}, {-1, kCos90, 0}, {0, 0, 1}}}));
    EXPECT_EQ(built([](auto& c) { c.x_rotation = 90; }), (M{{{1, 0, 0}, {0, kCos90, 1}, {0, -1, kCos90}}}));
    EXPECT_EQ(built([](auto& c) { c.y_rotation = 30; }),
              (M{{{kCos30, 0, -kSin30}, {0, 1, 0}, {kSin30, 0, kCos30}}}));
    EXPECT_EQ(built([](auto& c) { c.z_rotation = 180; }), (M{{{-1, kSin180, 0}, {-kSin180, -1, 0}, {0, 0, 1}}}));
    EXPECT_EQ(built([](auto& c) { c.x_mirror = 1, c.x_scale = 2; }), (M{{{-2, 0, 0}, {0, 1, 0}, {0, 0, 1}}}));
    // Any non-zero flag mirrors.
    EXPECT_EQ(built([](auto& c) { c.y_mirror = 7, c.y_scale = 3, c.z_mirror = 1, c.z_scale = 0.5f; }),
              (M{{{1, 0, 0}, {0, -3, 0}, {0, 0, -0.5f}}}));
}

TEST(TransformComponents, CombinedRotationsMultiplyXThenYThenZ) {
    TransformComponents c;
    c.x_rotation = 30, c.x_scale = 2, c.y_rotation = 45, c.y_mirror = 1, c.z_rotation = 60, c.z_scale = 0.5f;
    c.x_offset = 1, c.y_offset = 2, c.z_offset = 3;
    // (M_x · M_y) · M_z evaluated step by step in 32-bit floats.
    const Matrix expected{{{0x1.6a09e4p-1f, -0x1.257d88p-1f, -0x1.7a7848p-1f},
                           {-0x1.3988e2p+0f, -0x1.7a7848p-1f, 0x1.1f0ed8p-2f},
                           {0x1.6a09e6p-1f, -0x1.6a09e6p-3f, 0x1.3988ep-2f}}};
    EXPECT_EQ(c.buildMatrix(), expected);
    EXPECT_EQ(c.buildTransform(), (Transform{expected, Vector{1, 2, 3}}));
    EXPECT_EQ(TransformComponents{}.buildTransform(), Transform::identity());
}
