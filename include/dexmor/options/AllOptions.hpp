#pragma once
// AllOptions: the options set, root object of a render-options file. It holds
// every render setting of one scene: the renderer parameter block, the frame data,
// the frame-buffer stamp and the physical camera, and its own fields (environment
// colours and textures, output image, render channels, colour correction, ten
// file names). It is stored as one versioned record (the table in AllOptions.cpp)
// and written to XML as twenty-one settings sections (SettingsSections.cpp).
//
// Switches are 32-bit integers: 0 is off, anything else on. The fields named
// aux_* mean nothing to the XML; they are stored and read back so that a file
// survives a round trip.
#include <dexmor/archive/Record.hpp>
#include <dexmor/options/OrvexFrameData.hpp>
#include <dexmor/options/OrvexOptionsBase.hpp>
#include <dexmor/options/OrvexParams.hpp>
#include <dexmor/options/OrvexVFBStampInfo.hpp>
#include <dexmor/options/PhysicalCamera.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseTexture.hpp>

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

class AllOptions : public OrvexOptionsBase {
public:
    // The record begins with VersionWord(1, N). Readers accept N = 0 to 9 and
    // 16 to 23; writers write 23.
    static constexpr std::uint16_t kVersionFirstHalf = 1;
    static constexpr std::uint16_t kVersion = 23;
    static constexpr bool acceptsVersion(unsigned n) { return n <= 9 || (n >= 16 && n <= kVersion); }

    // A file name holds at most this many UTF-16 code units (the buffer it lived
    // in held 2047 characters and a terminating zero).
    static constexpr std::size_t kFileNameUnits = 2047;
    // Stored channel ids outside this range are dropped on reading.
    static constexpr std::uint32_t kFirstStoredChannel = 100;
    static constexpr std::uint32_t kLastStoredChannel = 132;

    // The fields in declaration order, with their defaults. The renderer
    // parameter block starts from its own defaults with the options set's
    // overrides (applied by the constructor).
    OrvexParams params;
    OrvexFrameData frameData;
    OrvexVFBStampInfo stampInfo;
    Color bg_color{0.0f, 0.0f, 0.0f};
    Color gi_color{0.8f, 0.8980392f, 1.0f};
    Color reflect_color{0.0f, 0.0f, 0.0f};
    Color refract_color{0.0f, 0.0f, 0.0f};
    Color aux_color{0.5f, 0.5f, 0.5f};
    // Environment textures; any of them may be empty. Copies of an options set
    // share them.
    TexturePtr bg_tex;
    TexturePtr gi_tex;
    TexturePtr reflect_tex;
    TexturePtr refract_tex;
    // Render channel ids (see options/RenderChannels.hpp), in frame-buffer order.
    std::vector<std::uint32_t> channels{126, 125}; // "RGB color", "Alpha"
    std::int32_t use_gi = 0;
    std::int32_t use_bg = 0;
    std::int32_t use_reflect = 0;
    std::int32_t use_refract = 0;
    std::int32_t filter_kind = 5;
    std::int32_t img_height = 600;
    std::int32_t img_width = 800;
    std::int32_t override_fov = 0;
    std::int32_t override_viewport = 0;
    std::int32_t aux_i1 = 0;
    std::int32_t aux_i2 = 0;
    std::int32_t img_rawFile = 0;
    std::int32_t save_render = 0;
    std::int32_t aux_i3 = 1;
    std::int32_t inverse_override_focal_dist = 1;
    std::int32_t aux_i4 = 1;
    std::int32_t aux_i5 = 0;
    std::int32_t aux_i6 = 1;
    std::int32_t aux_i7 = 0;
    std::string aux_text; // UTF-8
    float aux_f1 = 0.0f;
    float aux_f2 = 0.0f;
    float fov = 45.0f;
    float gi_mult = 1.0f;
    float bg_mult = 1.0f;
    float reflect_mult = 1.0f;
    float refract_mult = 1.0f;
    float gi_tex_mult = 1.0f;
    float bg_tex_mult = 1.0f;
    float reflect_tex_mult = 1.0f;
    float refract_tex_mult = 1.0f;
    float filter_size = 1.5f;
    float aux_f3 = 1.333f;
    float img_pixelAspect = 1.0f;
    float zdepth_black = 0.0f;
    float zdepth_white = 1000.0f;
    std::int32_t zdepth_clamp = 1;
    PhysicalCamera camera;
    std::int32_t physical_on = 0;
    std::int32_t override_focal_length = 0;
    std::int32_t gamma_correct_rgb = 0;
    std::int32_t gamma_correct_ldr_textures = 0;
    float input_gamma = 2.2f;
    std::int32_t aux_i8 = 1;
    std::int32_t do_animation = 0;
    std::int32_t frame_rate = 0;
    float frames_per_second = 30.0f;
    std::int32_t aux_i9 = 0;
    std::int32_t specify_film_width = 0;
    // File names, UTF-8, at most kFileNameUnits UTF-16 code units each (a longer
    // name is stored and shown cut to that length).
    std::string img_file;
    std::string kvimg_file;
    std::string im_file;
    std::string im_auto_save_file;
    std::string lc_file;
    std::string lc_auto_save_file;
    std::string pm_file;
    std::string pm_auto_save_file;
    std::string caustics_file;
    std::string caustics_auto_save_file;

    // Every field at its default.
    AllOptions();

    // Writes the record of version 23; false when a block, the camera or a texture
    // fails to write.
    bool writeToArchive(QuickArchive& ar) override;
    // Resets, then reads a record of an accepted version; fields an older version
    // lacks keep their defaults. False for another version word, a block, camera
    // or texture that does not read, or a channel list longer than the data.
    bool readFromArchive(QuickArchive& ar) override;
    // The renderer parameter block's defaults with the options set's overrides,
    // the blocks' and the camera's defaults, no textures, the channels 126 and 125,
    // empty file names, and the defaults of every other field.
    void resetToDefaults() override;

    // The twenty-one settings sections, each an asset inside an "Assets" element
    // of its own, under the urls `path` + "/" + section name (SettingsSections.cpp).
    void writeXml(AssetXmlWriter& writer, std::string path) override;
    std::string pluginType() const override { return "AllOptions"; }
    std::string assetType() const override { return "settings"; }

    // Every stored field equal: the blocks and the camera by their own comparison,
    // textures by theirs (both absent, or both present and equal).
    bool isEqual(const AllOptions& other) const;
    // The name of the first stored field that differs, or nullptr.
    const char* firstDifference(const AllOptions& other) const;

    // The part of a file name that the options set keeps: up to its first NUL, at
    // most kFileNameUnits UTF-16 units, never half a surrogate pair.
    static std::string_view fileNameText(std::string_view name);

    // The record as a table, one row per stored value in archive order (after the
    // version word), each with the record versions that hold it.
    static std::span<const record::Field<AllOptions>> recordFields();
};

} // namespace OrvexKavorCore
