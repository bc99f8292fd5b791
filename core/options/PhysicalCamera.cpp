#include <dexmor/options/PhysicalCamera.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/MemberEncodings.hpp"
#include "options/RecordEncodings.hpp"

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using C = PhysicalCamera;
using record::always;
using record::between;
using record::since;

#define ROW(name, encoding, versions) record::fieldAs<record::enc::encoding, &C::name>(#name, versions)

// The camera's record after its VersionWord(0, V), in archive order. A record of
// version V holds the rows whose versions include V.
constexpr std::array kFields{
    //  field                  encoding          versions
    ROW(type,                  Int32,            always()),
    ROW(film_width,            Float32,          always()),
    ROW(focal_length,          AnimatedAsPlain,  between(1, 1)),
    ROW(focal_length,          Animated,         since(2)),
    ROW(zoom_factor,           Float32,          always()),
    ROW(distortion,            Float32,          always()),
    ROW(f_number,              Float32,          always()),
    ROW(lens_shift,            Float32,          always()),
    ROW(shutter_speed,         Float32,          always()),
    ROW(shutter_angle,         Float32,          always()),
    ROW(shutter_offset,        Float32,          always()),
    ROW(latency,               Float32,          always()),
    ROW(ISO,                   Float32,          always()),
    ROW(specify_focus,         Int32,            always()),
    ROW(focus_distance,        AnimatedAsPlain,  between(1, 1)),
    ROW(focus_distance,        Animated,         since(2)),
    ROW(targeted,              Int32,            always()),
    ROW(target_distance,       Float32,          always()),
    ROW(dof_display_threshold, Float32,          always()),
    ROW(exposure,              Int32,            always()),
    ROW(white_balance,         Color,            always()),
    ROW(vignetting,            Int32,            always()),
    ROW(blades_enable,         Int32,            always()),
    ROW(blades_num,            Int32,            always()),
    ROW(blades_rotation,       Float32,          always()),
    ROW(center_bias,           Float32,          always()),
    ROW(anisotropy,            Float32,          always()),
    ROW(use_dof,               Int32,            always()),
    ROW(use_moblur,            Int32,            always()),
    ROW(subdivs,               Int32,            always()),
};

#undef ROW

static_assert(record::enc::countHeld(kFields, 1) == 28 && record::enc::countHeld(kFields, 2) == 28,
              "both versions store the 28 fields");

} // namespace

PhysicalCamera::PhysicalCamera() {
    focal_length.setConstant(40.0f);
    focus_distance.setConstant(200.0f);
}

bool PhysicalCamera::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    return record::writeFields(ar, *this, kFields, kVersion);
}

bool PhysicalCamera::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (version.first() != 0 || version.second() < 1 || version.second() > kVersion)
        return ar.fail("unknown physical camera version (" + std::to_string(version.first()) + ", " +
                       std::to_string(version.second()) + ")");
    return record::readFields(ar, *this, kFields, version.second());
}

CameraPtr PhysicalCamera::clone() const { return boost::make_shared<PhysicalCamera>(*this); }

void PhysicalCamera::resetToDefaults() { *this = PhysicalCamera(); }

bool PhysicalCamera::isEqual(const PhysicalCamera& other) const { return record::fieldsEqual(*this, other, kFields); }

const char* PhysicalCamera::firstDifference(const PhysicalCamera& other) const {
    return record::firstDifference(*this, other, kFields);
}

std::span<const record::Field<PhysicalCamera>> PhysicalCamera::recordFields() { return kFields; }

} // namespace OrvexKavorCore
