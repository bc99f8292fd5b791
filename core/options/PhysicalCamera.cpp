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


// The camera's record after its VersionWord(0, V), in archive order. A record of
// version V holds the rows whose versions include V.
constexpr std::array kFields{
    record::fieldAs<record::enc::Int32, &C::type>("type", always()),
    record::fieldAs<record::enc::Float32, &C::film_width>("film_width", always()),
    record::fieldAs<record::enc::AnimatedAsPlain, &C::focal_length>("focal_length", between(1, 1)),
    record::fieldAs<record::enc::Animated, &C::focal_length>("focal_length", since(2)),
    record::fieldAs<record::enc::Float32, &C::zoom_factor>("zoom_factor", always()),
    record::fieldAs<record::enc::Float32, &C::distortion>("distortion", always()),
    record::fieldAs<record::enc::Float32, &C::f_number>("f_number", always()),
    record::fieldAs<record::enc::Float32, &C::lens_shift>("lens_shift", always()),
    record::fieldAs<record::enc::Float32, &C::shutter_speed>("shutter_speed", always()),
    record::fieldAs<record::enc::Float32, &C::shutter_angle>("shutter_angle", always()),
    record::fieldAs<record::enc::Float32, &C::shutter_offset>("shutter_offset", always()),
    record::fieldAs<record::enc::Float32, &C::latency>("latency", always()),
    record::fieldAs<record::enc::Float32, &C::ISO>("ISO", always()),
    record::fieldAs<record::enc::Int32, &C::specify_focus>("specify_focus", always()),
    record::fieldAs<record::enc::AnimatedAsPlain, &C::focus_distance>("focus_distance", between(1, 1)),
    record::fieldAs<record::enc::Animated, &C::focus_distance>("focus_distance", since(2)),
    record::fieldAs<record::enc::Int32, &C::targeted>("targeted", always()),
    record::fieldAs<record::enc::Float32, &C::target_distance>("target_distance", always()),
    record::fieldAs<record::enc::Float32, &C::dof_display_threshold>("dof_display_threshold", always()),
    record::fieldAs<record::enc::Int32, &C::exposure>("exposure", always()),
    record::fieldAs<record::enc::Color, &C::white_balance>("white_balance", always()),
    record::fieldAs<record::enc::Int32, &C::vignetting>("vignetting", always()),
    record::fieldAs<record::enc::Int32, &C::blades_enable>("blades_enable", always()),
    record::fieldAs<record::enc::Int32, &C::blades_num>("blades_num", always()),
    record::fieldAs<record::enc::Float32, &C::blades_rotation>("blades_rotation", always()),
    record::fieldAs<record::enc::Float32, &C::center_bias>("center_bias", always()),
    record::fieldAs<record::enc::Float32, &C::anisotropy>("anisotropy", always()),
    record::fieldAs<record::enc::Int32, &C::use_dof>("use_dof", always()),
    record::fieldAs<record::enc::Int32, &C::use_moblur>("use_moblur", always()),
    record::fieldAs<record::enc::Int32, &C::subdivs>("subdivs", always()),
};


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
    if (!ar.checkVersion(version, kVersion, "physical camera")) return false;
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
