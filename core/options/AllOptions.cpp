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

#define ROW(name, encoding, first) record::fieldAs<enc::encoding, &O::name>(#name, record::since(first))
#define ROW_IN(name, encoding, first, last) \
    record::fieldAs<enc::encoding, &O::name>(#name, record::between(first, last))

// The options set's record after its VersionWord(1, N), in archive order. A record
// of version N holds the rows whose versions include N. The comment is the row's
// number in the record (the version word is row 1).
constexpr std::array kFields{
    //     field                         encoding            since       #
    ROW(   params,                       Record,             0),      // 2
    ROW(   frameData,                    Record,             0),      // 3
    ROW(   stampInfo,                    Record,             0),      // 4
    ROW(   camera,                       Record,             5),      // 5
    ROW(   bg_tex,                       OptionalTexture,    0),      // 6
    ROW(   gi_tex,                       OptionalTexture,    0),      // 7
    ROW(   bg_color,                     Color,              0),      // 8
    ROW(   gi_color,                     Color,              0),      // 9
    ROW(   use_gi,                       Int32,              0),      // 10
    ROW(   use_bg,                       Int32,              0),      // 11
    ROW(   filter_kind,                  Int32,              0),      // 12
    ROW(   img_height,                   Int32,              0),      // 13
    ROW(   img_width,                    Int32,              0),      // 14
    ROW(   override_fov,                 Int32,              0),      // 15
    ROW(   override_viewport,            Int32,              0),      // 16
    ROW(   aux_i2,                       Int32,              0),      // 17 (aux_i2 before aux_i1)
    ROW(   aux_i1,                       Int32,              0),      // 18
    ROW(   img_rawFile,                  Int32,              0),      // 19
    ROW(   save_render,                  Int32,              0),      // 20
    ROW(   inverse_override_focal_dist,  Int32,              2),      // 21
    ROW(   aux_i4,                       Int32,              3),      // 22
    ROW(   physical_on,                  Int32,              5),      // 23
    ROW(   override_focal_length,        Int32,              6),      // 24
    ROW(   fov,                          Float32,            0),      // 25
    ROW(   gi_mult,                      Float32,            0),      // 26
    ROW(   bg_mult,                      Float32,            0),      // 27
    ROW(   gi_tex_mult,                  Float32,            0),      // 28
    ROW(   bg_tex_mult,                  Float32,            0),      // 29
    ROW(   filter_size,                  Float32,            0),      // 30
    ROW(   img_pixelAspect,              Float32,            0),      // 31
    ROW(   aux_f3,                       Float32,            0),      // 32
    ROW(   zdepth_black,                 Float32,            4),      // 33
    ROW(   zdepth_white,                 Float32,            4),      // 34
    ROW(   zdepth_clamp,                 Int32,              4),      // 35
    ROW_IN(channels,                     ChannelsOfVersion0, 0, 0),   // 36 in version 0
    ROW_IN(channels,                     ChannelsAdded,      1, 20),  // 36 in versions 1 to 20
    ROW(   channels,                     ChannelsReplacing,  21),     // 36 from version 21 on
    ROW(   img_file,                     FileName,           0),      // 37
    ROW(   kvimg_file,                   FileName,           0),      // 38
    ROW(   im_file,                      FileName,           0),      // 39
    ROW(   im_auto_save_file,            FileName,           0),      // 40
    ROW(   lc_file,                      FileName,           0),      // 41
    ROW(   lc_auto_save_file,            FileName,           0),      // 42
    ROW(   pm_file,                      FileName,           0),      // 43
    ROW(   pm_auto_save_file,            FileName,           0),      // 44
    ROW(   caustics_file,                FileName,           0),      // 45
    ROW(   caustics_auto_save_file,      FileName,           0),      // 46
    ROW(   aux_color,                    Color,              1),      // 47
    ROW(   aux_i3,                       Int32,              1),      // 48
    ROW(   gamma_correct_rgb,            Int32,              7),      // 49
    ROW(   gamma_correct_ldr_textures,   Int32,              7),      // 50
    ROW(   do_animation,                 Int32,              8),      // 51
    ROW(   frame_rate,                   Int32,              8),      // 52
    ROW(   frames_per_second,            Float32,            8),      // 53
    ROW(   reflect_color,                Color,              9),      // 54
    ROW(   refract_color,                Color,              9),      // 55
    ROW(   reflect_mult,                 Float32,            9),      // 56
    ROW(   refract_mult,                 Float32,            9),      // 57
    ROW(   reflect_tex_mult,             Float32,            9),      // 58
    ROW(   refract_tex_mult,             Float32,            9),      // 59
    ROW(   use_reflect,                  Int32,              9),      // 60
    ROW(   use_refract,                  Int32,              9),      // 61
    ROW(   reflect_tex,                  OptionalTexture,    9),      // 62
    ROW(   refract_tex,                  OptionalTexture,    9),      // 63
    ROW(   aux_i5,                       Int32,              16),     // 64
    ROW(   aux_f1,                       Float32,            17),     // 65
    ROW(   aux_f2,                       Float32,            17),     // 66
    ROW(   input_gamma,                  Float32,            18),     // 67
    ROW(   aux_i8,                       Int32,              19),     // 68
    ROW(   aux_i6,                       Int32,              20),     // 69
    ROW(   aux_i7,                       Int32,              20),     // 70
    ROW(   aux_text,                     WString,            20),     // 71
    ROW(   aux_i9,                       Int32,              22),     // 72
    ROW(   specify_film_width,           Int32,              23),     // 73
};

#undef ROW
#undef ROW_IN

static_assert(record::enc::countHeld(kFields, 23) == 72, "a version-23 record holds rows 2 to 73");
static_assert(record::enc::countHeld(kFields, 0) == 37, "a version-0 record holds 37 rows after its version word");

std::string versionText(VersionWord version) {
    return "(" + std::to_string(version.first()) + ", " + std::to_string(version.second()) + ")";
}

} // namespace

AllOptions::AllOptions() { resetToDefaults(); }

void AllOptions::resetToDefaults() {
    params.resetToDefaults();
    params.applyOptionsSetOverrides();
    frameData.resetToDefaults();
    stampInfo.resetToDefaults();
    channels.clear();

    bg_color = Color{0.0f, 0.0f, 0.0f};
    gi_color = Color{0.8f, 0.8980392f, 1.0f};
    reflect_color = Color{0.0f, 0.0f, 0.0f};
    refract_color = Color{0.0f, 0.0f, 0.0f};
    aux_color = Color{0.5f, 0.5f, 0.5f};
    bg_tex.reset();
    gi_tex.reset();
    reflect_tex.reset();
    refract_tex.reset();
    use_gi = 0;
    use_bg = 0;
    use_reflect = 0;
    use_refract = 0;
    filter_kind = 5;
    img_height = 600;
    img_width = 800;
    override_fov = 0;
    override_viewport = 0;
    aux_i1 = 0;
    aux_i2 = 0;
    img_rawFile = 0;
    save_render = 0;
    aux_i3 = 1;
    inverse_override_focal_dist = 1;
    aux_i4 = 1;
    aux_i5 = 0;
    aux_i6 = 1;
    aux_i7 = 0;
    aux_text.clear();
    // Reset as well (not only at construction), so that reading an older record
    // into a used options set does not keep values of the earlier content.
    aux_f1 = 0.0f;
    aux_f2 = 0.0f;
    fov = 45.0f;
    gi_mult = 1.0f;
    bg_mult = 1.0f;
    reflect_mult = 1.0f;
    refract_mult = 1.0f;
    gi_tex_mult = 1.0f;
    bg_tex_mult = 1.0f;
    reflect_tex_mult = 1.0f;
    refract_tex_mult = 1.0f;
    filter_size = 1.5f;
    aux_f3 = 1.333f;
    img_pixelAspect = 1.0f;
    zdepth_black = 0.0f;
    zdepth_white = 1000.0f;
    zdepth_clamp = 1;
    camera.resetToDefaults();
    physical_on = 0;
    override_focal_length = 0;
    gamma_correct_rgb = 0;
    gamma_correct_ldr_textures = 0;
    input_gamma = 2.2f;
    aux_i8 = 1;
    do_animation = 0;
    frame_rate = 0;
    frames_per_second = 30.0f;
    aux_i9 = 0;
    specify_film_width = 0;
    for (std::string* name : {&img_file, &kvimg_file, &im_file, &im_auto_save_file, &lc_file, &lc_auto_save_file,
                              &pm_file, &pm_auto_save_file, &caustics_file, &caustics_auto_save_file})
        name->clear();

    channels = {126, 125}; // "RGB color", "Alpha"
}

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
