#pragma once
// PhysicalCamera: a photographic camera (film gate, focal length, aperture,
// shutter, focus, white balance, bokeh blades), the one camera kind. The options
// set holds one, stores it inside its record and shows its fields in its
// "CameraPhysical" section; the camera writes no asset of its own.
//
// Record, version 2: VersionWord(0, 2), then the fields in declaration order,
// switches and counts as Int32, numbers as Float32, white_balance as Color, and
// focal_length and focus_distance as the records of their keyed values. Version 1
// stores those two as one plain Float32 each, which becomes the value at time 0.
// The table in PhysicalCamera.cpp is that layout, row by row.
#include <dexmor/archive/Record.hpp>
#include <dexmor/options/BaseCamera.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

class PhysicalCamera : public BaseCamera {
public:
    static constexpr std::int32_t kKind = 0;
    static constexpr std::uint16_t kVersion = 2;

    // Switches are 32-bit integers: 0 is off, anything else on.
    std::int32_t type = 0;
    float film_width = 36.0f;
    AnimatedReal focal_length;  // constant 40
    float zoom_factor = 1.0f;
    float distortion = 0.0f;
    float f_number = 8.0f;
    float lens_shift = 0.0f;
    float shutter_speed = 30.0f;
    float shutter_angle = 180.0f;
    float shutter_offset = 0.0f;
    float latency = 0.0f;
    float ISO = 200.0f;
    std::int32_t specify_focus = 0;
    AnimatedReal focus_distance; // constant 200
    std::int32_t targeted = 0;
    float target_distance = 200.0f;
    float dof_display_threshold = 0.0f;
    std::int32_t exposure = 1;
    Color white_balance{1.0f, 1.0f, 1.0f};
    std::int32_t vignetting = 1;
    std::int32_t blades_enable = 0;
    std::int32_t blades_num = 5;
    float blades_rotation = 0.0f;
    float center_bias = 0.0f;
    float anisotropy = 0.0f;
    std::int32_t use_dof = 0;
    std::int32_t use_moblur = 0;
    std::int32_t subdivs = 6;

    PhysicalCamera();

    // Writes version 2; false when a keyed value fails to write.
    bool writeToArchive(QuickArchive& ar) override;
    // Resets, then reads version 1 or 2; any other version word, or a keyed value
    // that does not read, fails.
    bool readFromArchive(QuickArchive& ar) override;
    std::int32_t kindId() const override { return kKind; }
    CameraPtr clone() const override;
    void resetToDefaults() override;

    // The options set writes the camera's fields in its own section.
    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return "CameraPhysical"; }
    std::string assetType() const override { return "settings"; }

    // Every field equal (exact comparison; keyed values key by key).
    bool isEqual(const PhysicalCamera& other) const;
    // The name of the first field that differs, or nullptr.
    const char* firstDifference(const PhysicalCamera& other) const;

    // The record as a table, one row per stored value in archive order.
    static std::span<const record::Field<PhysicalCamera>> recordFields();
};

} // namespace OrvexKavorCore
