// The physical camera and the render view: their records of every version,
// assembled here byte by byte, and the render view's asset.
#include "TrimSupport.hpp"

#include <dexmor/options/PhysicalCamera.hpp>
#include <dexmor/options/RenderView.hpp>

#include <gtest/gtest.h>

#include <climits>
#include <string>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// A keyed value's record with one key at time 0.
ByteVector constantReal(float v) { return Image{}.version(0, 1).u32(1).u32(8).flag(true).f64(0).f32({v}).bytes; }
ByteVector constantInt(std::int32_t v) { return Image{}.version(0, 1).u32(1).u32(8).flag(true).f64(0).i32(v).bytes; }

// A camera record with distinct values in every row; `focal` and `focus` are the
// stored forms of the two keyed values.
ByteVector cameraRecord(std::uint16_t version, const ByteVector& focal, const ByteVector& focus) {
    return Image{}.version(0, version).i32(1).f32({35}).append(focal)        // type, film_width, focal_length
        .f32({1.5f, -0.25f, 5.6f, 0.125f, 60, 90, -0.5f, 0.01f, 400})       // zoom_factor .. ISO
        .i32(1).append(focus).i32(1).f32({150, 0.3f})                        // specify_focus .. dof_display_threshold
        .i32(0).f32({0.9f, 0.8f, 0.7f}).i32(0).i32(1).i32(7)                  // exposure .. blades_num
        .f32({45, 0.2f, -0.1f}).i32(1).i32(1).i32(12)                        // blades_rotation .. subdivs
        .bytes;
}

PhysicalCamera cameraOfTheRecord(float focal, float focus) {
    PhysicalCamera c;
    c.type = 1, c.film_width = 35, c.zoom_factor = 1.5f, c.distortion = -0.25f, c.f_number = 5.6f;
    c.lens_shift = 0.125f, c.shutter_speed = 60, c.shutter_angle = 90, c.shutter_offset = -0.5f, c.latency = 0.01f;
    c.ISO = 400, c.specify_focus = 1, c.targeted = 1, c.target_distance = 150, c.dof_display_threshold = 0.3f;
    c.exposure = 0, c.white_balance = Color{0.9f, 0.8f, 0.7f}, c.vignetting = 0, c.blades_enable = 1;
    c.blades_num = 7, c.blades_rotation = 45, c.center_bias = 0.2f, c.anisotropy = -0.1f, c.use_dof = 1;
    c.use_moblur = 1, c.subdivs = 12;
    c.focal_length.setConstant(focal);
    c.focus_distance.setConstant(focus);
    return c;
}

} // namespace

TEST(Camera, BothVersionsReadEveryRow) {
    // Version 1 stores focal length and focus distance as plain numbers.
    const auto plain = [](float v) { return Image{}.f32({v}).bytes; };
    PhysicalCamera camera;
    ASSERT_TRUE(readInto(camera, cameraRecord(1, plain(50.0f), plain(321.0f))));
    EXPECT_TRUE(camera.isEqual(cameraOfTheRecord(50.0f, 321.0f))) << camera.firstDifference(cameraOfTheRecord(50, 321));
    const ByteVector version2 = cameraRecord(2, constantReal(50.0f), constantReal(321.0f));
    EXPECT_EQ(recordOf(camera), version2);

    // Version 2 keeps keyed values with several keys.
    camera.focal_length.setValue(85.0f, 10.0);
    camera.focus_distance.setInterpolate(false);
    camera.focus_distance.setValue(1.0f, -2.0);
    PhysicalCamera back;
    ASSERT_TRUE(readInto(back, recordOf(camera)));
    EXPECT_TRUE(back.isEqual(camera)) << back.firstDifference(camera);
    EXPECT_EQ(back.focal_length.keyCount(), 2);
    EXPECT_EQ(back.focus_distance.valueAt(-1.0), 1.0f);

    const CameraPtr copy = back.clone();
    EXPECT_TRUE(copy->kindId() == 0 && dynamic_cast<const PhysicalCamera&>(*copy).isEqual(camera));
    copy->resetToDefaults();
    EXPECT_TRUE(dynamic_cast<const PhysicalCamera&>(*copy).isEqual(PhysicalCamera{}));
}

TEST(Camera, RejectedRecords) {
    const ByteVector good = constantReal(1.0f);
    const std::pair<ByteVector, std::string> cases[] = {
        {cameraRecord(3, good, good), "unknown physical camera version (0, 3)"},
        {cameraRecord(0, good, good), "unknown physical camera version (0, 0)"},
        {Image{}.version(1, 2).append(cameraRecord(2, good, good)).bytes, "unknown physical camera version (1, 2)"},
        {cameraRecord(2, Image{}.version(0, 2).bytes, good), "focal_length: unknown animated real version"},
    };
    for (const auto& [bytes, failure] : cases) {
        PhysicalCamera camera;
        expectReadFails(camera, bytes, failure);
    }
}

// --- render view ---

namespace {

ByteVector boxes() { return Image{}.i32(10).i32(20).i32(110).i32(220).i32(-5).i32(0).i32(5).i32(2).bytes; }
const std::initializer_list<float> kTurn = {0, 1, 0, -1, 0, 0, 0, 0, 1, 4, 5, 6};
ByteVector transformRecord() { return Image{}.version(0, 1).u32(1).u32(8).u32(0).u32(0).f32(kTurn).bytes; }

} // namespace

TEST(RenderView, EveryVersionReadsTheSameView) {
    const ByteVector version3 = Image{}.version(0, 3).append(boxes()).i32(640).i32(480)
                                    .append(constantReal(0.5f)).append(constantReal(2.0f)).append(constantReal(3.0f))
                                    .append(constantInt(1)).append(transformRecord()).bytes;
    // Versions 1 and 2 store the keyed values as plain numbers and anim_i1 as a
    // flag whose 0 means 1.
    const auto older = [](std::uint16_t version, bool flag) {
        Image image;
        image.version(0, version);
        if (version == 1) image.f32(kTurn);
        image.append(boxes()).f32({0.5f, 2.0f, 3.0f}).i32(640).i32(480).flag(flag);
        if (version == 2) image.append(transformRecord());
        return image.bytes;
    };
    const std::pair<ByteVector, std::int32_t> cases[] = {
        {version3, 1}, {older(2, false), 1}, {older(2, true), 0}, {older(1, false), 1}, {older(1, true), 0}};
    for (const auto& [bytes, animI1] : cases) {
        RenderView view;
        ASSERT_TRUE(readInto(view, bytes));
        EXPECT_TRUE(view.box1 == (IntBox{10, 20, 110, 220}) && view.box1.width() == 100 && view.box1.height() == 200);
        EXPECT_EQ(view.box2, (IntBox{-5, 0, 5, 2}));
        EXPECT_TRUE(view.img_height == 480 && view.anim_r3.valueAt(0.0) == 3.0f);
        EXPECT_EQ(view.transform.valueAt(0.0), (Transform{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 1}}}, Vector{4, 5, 6}}));
        EXPECT_EQ(view.anim_i1.valueAt(0.0), animI1);
        view.anim_i1.setConstant(1);
        EXPECT_EQ(recordOf(view), version3);
    }
}

TEST(RenderView, BoxesAndRejectedVersions) {
    // Corners further apart than 32 bits can tell wrap around instead of overflowing.
    EXPECT_EQ((IntBox{INT_MIN, 0, INT_MAX, 5}).width(), -1);

    for (const auto& [first, second] : {std::pair<std::uint16_t, std::uint16_t>{0, 4}, {0, 0}, {1, 3}}) {
        RenderView view;
        view.img_width = 1;
        expectReadFails(view, Image{}.version(first, second).append(boxes()).bytes,
                        "unknown render view version (" + std::to_string(first) + ", " + std::to_string(second) +
                            ") at offset 4");
        EXPECT_TRUE(view.isEqual(RenderView{}));
    }
}

TEST(RenderView, Asset) {
    RenderView view;
    view.img_width = 1920;
    view.img_height = -1;
    expectGolden(xmlOf(view, "/scene"), "render_view.xml");
}
