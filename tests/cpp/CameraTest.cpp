// The physical camera and the render view: their records of every version,
// assembled here byte by byte, and the render view's asset.
#include "TrimSupport.hpp"

#include <dexmor/options/PhysicalCamera.hpp>
#include <dexmor/options/RenderView.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// A keyed value's record with one key at time 0.
ByteVector constantReal(float v) { return Image{}.version(0, 1).u32(1).u32(8).flag(true).f64(0).f32({v}).bytes; }
ByteVector constantInt(std::int32_t v) { return Image{}.version(0, 1).u32(1).u32(8).flag(true).f64(0).i32(v).bytes; }

// A camera record with distinct values in every row and the camera it reads to.
// Version 1 stores focal length and focus distance as plain numbers, version 2 as
// keyed values.
PhysicalCamera cameraOfTheRecord(int version, ByteVector* record) {
    using C = PhysicalCamera;
    Assembled<C> s(version);
    const auto keyed = [&](AnimatedReal C::*m, float value) {
        if (version == 1) return s.plain(m, value), void();
        s.image.append(constantReal(value));
        (s.object.*m).setValue(value, 0.0);
    };
    s.i(&C::type).f(&C::film_width);
    keyed(&C::focal_length, 50.0f);
    s.f(&C::zoom_factor).f(&C::distortion).f(&C::f_number).f(&C::lens_shift).f(&C::shutter_speed);
    s.f(&C::shutter_angle).f(&C::shutter_offset).f(&C::latency).f(&C::ISO).i(&C::specify_focus);
    keyed(&C::focus_distance, 321.0f);
    s.i(&C::targeted).f(&C::target_distance).f(&C::dof_display_threshold).i(&C::exposure).c(&C::white_balance);
    s.i(&C::vignetting).i(&C::blades_enable).i(&C::blades_num).f(&C::blades_rotation).f(&C::center_bias);
    s.f(&C::anisotropy).i(&C::use_dof).i(&C::use_moblur).i(&C::subdivs);
    *record = s.image.bytes;
    return s.object;
}

} // namespace

TEST(Camera, BothVersionsReadEveryRow) {
    ByteVector version1, version2;
    const PhysicalCamera expected = cameraOfTheRecord(1, &version1);
    EXPECT_TRUE(expected.isEqual(cameraOfTheRecord(2, &version2)));
    PhysicalCamera camera;
    ASSERT_TRUE(readInto(camera, version1));
    EXPECT_TRUE(camera.isEqual(expected)) << differenceOf(camera, expected);
    EXPECT_EQ(recordOf(camera), version2);

    // Version 2 keeps keyed values with several keys.
    camera.focal_length.setValue(85.0f, 10.0);
    camera.focus_distance.setInterpolate(false);
    camera.focus_distance.setValue(1.0f, -2.0);
    PhysicalCamera back;
    ASSERT_TRUE(readInto(back, recordOf(camera)));
    EXPECT_TRUE(back.isEqual(camera)) << differenceOf(back, camera);
    EXPECT_TRUE(back.focal_length.keyCount() == 2 && back.focus_distance.valueAt(-1.0) == 1.0f);
    const CameraPtr copy = back.clone();
    EXPECT_TRUE(copy->kindId() == 0 && dynamic_cast<const PhysicalCamera&>(*copy).isEqual(camera));
    copy->resetToDefaults();
    EXPECT_TRUE(dynamic_cast<const PhysicalCamera&>(*copy).isEqual(PhysicalCamera{}));
}

TEST(Camera, RejectedRecords) {
    ByteVector record;
    cameraOfTheRecord(2, &record);
    const std::pair<ByteVector, std::string> cases[] = {
        {withVersion(record, 0, 3), "unknown physical camera version (0, 3)"},
        {withVersion(record, 0, 0), "unknown physical camera version (0, 0)"},
        {withVersion(record, 1, 2), "unknown physical camera version (1, 2)"},
        {withVersion(record, 0, 2, 12), "focal_length: unknown animated real version"},
    };
    PhysicalCamera camera;
    for (const auto& [bytes, failure] : cases) expectReadFails(camera, bytes, failure);
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
