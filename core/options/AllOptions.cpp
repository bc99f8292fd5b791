#include <dexmor/options/AllOptions.hpp>

#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include "options/MemberEncodings.hpp"
#include "options/RecordEncodings.hpp"
#include <dexmor/platform/Text.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

// The encodings of the rows below: the primitives and member encodings, and the
// options set's own.
namespace enc {

using namespace record::enc;

// An environment texture: Bool present, then (when present) Int32 kind id and the
// texture's record.
struct OptionalTexture {
    static bool read(QuickArchive& ar, TexturePtr& texture) { return readOptionalMember(ar, texture); }
    static bool write(QuickArchive& ar, const TexturePtr& texture) { return writeOptionalMember(ar, texture); }
    static bool equal(const TexturePtr& a, const TexturePtr& b) { return membersEqual(a, b); }
};

// A file name: a WString, of which the options set keeps AllOptions::fileNameText.
struct FileName {
    static bool read(QuickArchive& ar, std::string& name) {
        std::string stored;
        if (!ar.readWString(stored)) return false;
        name = AllOptions::fileNameText(stored);
        return true;
    }
    static bool write(QuickArchive& ar, const std::string& name) {
        ar.writeWString(AllOptions::fileNameText(name));
        return true;
    }
    static bool equal(const std::string& a, const std::string& b) { return a == b; }
};

// The channel list: UInt32 count, then one UInt32 id each. Only the ids 100 to 132
// are kept. A record before version 21 adds its ids to the list the reset left
// (126, 125); a later one replaces that list. Version 0 gave the normals channel
// (123) the id 8.
template <bool kReplacesDefaults, bool kOldNormalsId>
struct Channels {
    static bool read(QuickArchive& ar, std::vector<std::uint32_t>& channels) {
        const auto count = ar.get<std::uint32_t>();
        if (!ar.canHold(count, sizeof(std::uint32_t)))
            return ar.fail(std::to_string(count) + " channel ids do not fit in the " + std::to_string(ar.remaining()) +
                           " bytes left");
        if (kReplacesDefaults) channels.clear();
        for (std::uint32_t i = 0; i < count; ++i) {
            auto id = ar.get<std::uint32_t>();
            if (kOldNormalsId && id == 8) id = 123;
            if (id >= AllOptions::kFirstStoredChannel && id <= AllOptions::kLastStoredChannel) channels.push_back(id);
        }
        return true;
    }
    static bool write(QuickArchive& ar, const std::vector<std::uint32_t>& channels) {
        ar.write(static_cast<std::uint32_t>(channels.size()));
        for (std::uint32_t id : channels) ar.write(id);
        return true;
    }
    static bool equal(const std::vector<std::uint32_t>& a, const std::vector<std::uint32_t>& b) { return a == b; }
};
using ChannelsOfVersion0 = Channels<false, true>;
using ChannelsAdded = Channels<false, false>;
using ChannelsReplacing = Channels<true, false>;

} // namespace enc

using O = AllOptions;

using record::between;
using record::since;

// The options set's record after its VersionWord(1, N), in archive order. A record
// of version N holds the rows whose versions include N. The comment is the row's
// number in the record (the version word is row 1).
constexpr std::array kFields{
    record::fieldAs<enc::Record, &O::params>("params", since(0)),      // 2
    record::fieldAs<enc::Record, &O::frameData>("frameData", since(0)),      // 3
    record::fieldAs<enc::Record, &O::stampInfo>("stampInfo", since(0)),      // 4
    record::fieldAs<enc::Record, &O::camera>("camera", since(5)),      // 5
    record::fieldAs<enc::OptionalTexture, &O::bg_tex>("bg_tex", since(0)),      // 6
    record::fieldAs<enc::OptionalTexture, &O::gi_tex>("gi_tex", since(0)),      // 7
    record::fieldAs<enc::Color, &O::bg_color>("bg_color", since(0)),      // 8
    record::fieldAs<enc::Color, &O::gi_color>("gi_color", since(0)),      // 9
    record::fieldAs<enc::Int32, &O::use_gi>("use_gi", since(0)),      // 10
    record::fieldAs<enc::Int32, &O::use_bg>("use_bg", since(0)),      // 11
    record::fieldAs<enc::Int32, &O::filter_kind>("filter_kind", since(0)),      // 12
    record::fieldAs<enc::Int32, &O::img_height>("img_height", since(0)),      // 13
    record::fieldAs<enc::Int32, &O::img_width>("img_width", since(0)),      // 14
    record::fieldAs<enc::Int32, &O::override_fov>("override_fov", since(0)),      // 15
    record::fieldAs<enc::Int32, &O::override_viewport>("override_viewport", since(0)),      // 16
    record::fieldAs<enc::Int32, &O::aux_i2>("aux_i2", since(0)),      // 17 (aux_i2 before aux_i1)
    record::fieldAs<enc::Int32, &O::aux_i1>("aux_i1", since(0)),      // 18
    record::fieldAs<enc::Int32, &O::img_rawFile>("img_rawFile", since(0)),      // 19
    record::fieldAs<enc::Int32, &O::save_render>("save_render", since(0)),      // 20
    record::fieldAs<enc::Int32, &O::inverse_override_focal_dist>("inverse_override_focal_dist", since(2)),      // 21
    record::fieldAs<enc::Int32, &O::aux_i4>("aux_i4", since(3)),      // 22
    record::fieldAs<enc::Int32, &O::physical_on>("physical_on", since(5)),      // 23
    record::fieldAs<enc::Int32, &O::override_focal_length>("override_focal_length", since(6)),      // 24
    record::fieldAs<enc::Float32, &O::fov>("fov", since(0)),      // 25
    record::fieldAs<enc::Float32, &O::gi_mult>("gi_mult", since(0)),      // 26
    record::fieldAs<enc::Float32, &O::bg_mult>("bg_mult", since(0)),      // 27
    record::fieldAs<enc::Float32, &O::gi_tex_mult>("gi_tex_mult", since(0)),      // 28
    record::fieldAs<enc::Float32, &O::bg_tex_mult>("bg_tex_mult", since(0)),      // 29
    record::fieldAs<enc::Float32, &O::filter_size>("filter_size", since(0)),      // 30
    record::fieldAs<enc::Float32, &O::img_pixelAspect>("img_pixelAspect", since(0)),      // 31
    record::fieldAs<enc::Float32, &O::aux_f3>("aux_f3", since(0)),      // 32
    record::fieldAs<enc::Float32, &O::zdepth_black>("zdepth_black", since(4)),      // 33
    record::fieldAs<enc::Float32, &O::zdepth_white>("zdepth_white", since(4)),      // 34
    record::fieldAs<enc::Int32, &O::zdepth_clamp>("zdepth_clamp", since(4)),      // 35
    record::fieldAs<enc::ChannelsOfVersion0, &O::channels>("channels", between(0, 0)),   // 36 in version 0
    record::fieldAs<enc::ChannelsAdded, &O::channels>("channels", between(1, 20)),  // 36 in versions 1 to 20
    record::fieldAs<enc::ChannelsReplacing, &O::channels>("channels", since(21)),     // 36 from version 21 on
    record::fieldAs<enc::FileName, &O::img_file>("img_file", since(0)),      // 37
    record::fieldAs<enc::FileName, &O::kvimg_file>("kvimg_file", since(0)),      // 38
    record::fieldAs<enc::FileName, &O::im_file>("im_file", since(0)),      // 39
    record::fieldAs<enc::FileName, &O::im_auto_save_file>("im_auto_save_file", since(0)),      // 40
    record::fieldAs<enc::FileName, &O::lc_file>("lc_file", since(0)),      // 41
    record::fieldAs<enc::FileName, &O::lc_auto_save_file>("lc_auto_save_file", since(0)),      // 42
    record::fieldAs<enc::FileName, &O::pm_file>("pm_file", since(0)),      // 43
    record::fieldAs<enc::FileName, &O::pm_auto_save_file>("pm_auto_save_file", since(0)),      // 44
    record::fieldAs<enc::FileName, &O::caustics_file>("caustics_file", since(0)),      // 45
    record::fieldAs<enc::FileName, &O::caustics_auto_save_file>("caustics_auto_save_file", since(0)),      // 46
    record::fieldAs<enc::Color, &O::aux_color>("aux_color", since(1)),      // 47
    record::fieldAs<enc::Int32, &O::aux_i3>("aux_i3", since(1)),      // 48
    record::fieldAs<enc::Int32, &O::gamma_correct_rgb>("gamma_correct_rgb", since(7)),      // 49
    record::fieldAs<enc::Int32, &O::gamma_correct_ldr_textures>("gamma_correct_ldr_textures", since(7)),      // 50
    record::fieldAs<enc::Int32, &O::do_animation>("do_animation", since(8)),      // 51
    record::fieldAs<enc::Int32, &O::frame_rate>("frame_rate", since(8)),      // 52
    record::fieldAs<enc::Float32, &O::frames_per_second>("frames_per_second", since(8)),      // 53
    record::fieldAs<enc::Color, &O::reflect_color>("reflect_color", since(9)),      // 54
    record::fieldAs<enc::Color, &O::refract_color>("refract_color", since(9)),      // 55
    record::fieldAs<enc::Float32, &O::reflect_mult>("reflect_mult", since(9)),      // 56
    record::fieldAs<enc::Float32, &O::refract_mult>("refract_mult", since(9)),      // 57
    record::fieldAs<enc::Float32, &O::reflect_tex_mult>("reflect_tex_mult", since(9)),      // 58
    record::fieldAs<enc::Float32, &O::refract_tex_mult>("refract_tex_mult", since(9)),      // 59
    record::fieldAs<enc::Int32, &O::use_reflect>("use_reflect", since(9)),      // 60
    record::fieldAs<enc::Int32, &O::use_refract>("use_refract", since(9)),      // 61
    record::fieldAs<enc::OptionalTexture, &O::reflect_tex>("reflect_tex", since(9)),      // 62
    record::fieldAs<enc::OptionalTexture, &O::refract_tex>("refract_tex", since(9)),      // 63
    record::fieldAs<enc::Int32, &O::aux_i5>("aux_i5", since(16)),     // 64
    record::fieldAs<enc::Float32, &O::aux_f1>("aux_f1", since(17)),     // 65
    record::fieldAs<enc::Float32, &O::aux_f2>("aux_f2", since(17)),     // 66
    record::fieldAs<enc::Float32, &O::input_gamma>("input_gamma", since(18)),     // 67
    record::fieldAs<enc::Int32, &O::aux_i8>("aux_i8", since(19)),     // 68
    record::fieldAs<enc::Int32, &O::aux_i6>("aux_i6", since(20)),     // 69
    record::fieldAs<enc::Int32, &O::aux_i7>("aux_i7", since(20)),     // 70
    record::fieldAs<enc::WString, &O::aux_text>("aux_text", since(20)),     // 71
    record::fieldAs<enc::Int32, &O::aux_i9>("aux_i9", since(22)),     // 72
    record::fieldAs<enc::Int32, &O::specify_film_width>("specify_film_width", since(23)),     // 73
};


static_assert(record::enc::countHeld(kFields, 23) == 72, "a version-23 record holds rows 2 to 73");
static_assert(record::enc::countHeld(kFields, 0) == 37, "a version-0 record holds 37 rows after its version word");

std::string versionText(VersionWord version) {
    std::string text = "(";
    text += std::to_string(version.first());
    text += ", ";
    text += std::to_string(version.second());
    text += ')';
    return text;
}

} // namespace

AllOptions::AllOptions() { params.applyOptionsSetOverrides(); }

void AllOptions::resetToDefaults() { *this = AllOptions(); }

bool AllOptions::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(kVersionFirstHalf, kVersion));
    return record::writeFields(ar, *this, kFields, kVersion);
}

bool AllOptions::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (version.first() != kVersionFirstHalf || !acceptsVersion(version.second()))
        return ar.fail("unknown options version " + versionText(version));
    return record::readFields(ar, *this, kFields, version.second());
}

bool AllOptions::isEqual(const AllOptions& other) const { return record::fieldsEqual(*this, other, kFields); }

const char* AllOptions::firstDifference(const AllOptions& other) const {
    return record::firstDifference(*this, other, kFields);
}

std::string_view AllOptions::fileNameText(std::string_view name) {
    return text::truncateToUtf16Units(text::upToFirstNul(name), kFileNameUnits);
}

std::span<const record::Field<AllOptions>> AllOptions::recordFields() { return kFields; }

} // namespace OrvexKavorCore
