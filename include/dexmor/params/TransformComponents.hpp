#pragma once
// The editable form of a transform: per axis a rotation in degrees, a scale, an
// offset and a mirror flag. The transform itself is rebuilt from these with
// buildTransform().
//
// Record:
//   VersionWord (0, 1)
//   Float32     x_rotation, y_rotation, z_rotation, x_scale, y_scale, z_scale,
//               x_offset, y_offset, z_offset
//   Int32       x_mirror, y_mirror, z_mirror
#include <dexmor/archive/Record.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <string_view>

namespace OrvexKavorCore {

class AssetXmlWriter;

class TransformComponents : public OrvexSerializable {
public:
    float x_rotation = 0.0f, y_rotation = 0.0f, z_rotation = 0.0f;
    float x_scale = 1.0f, y_scale = 1.0f, z_scale = 1.0f;
    float x_offset = 0.0f, y_offset = 0.0f, z_offset = 0.0f;
    std::int32_t x_mirror = 0, y_mirror = 0, z_mirror = 0;

    bool writeToArchive(QuickArchive& ar) override { return writeRecord(ar); }
    // Resets every field, then reads them; fails on any other version.
    bool readFromArchive(QuickArchive& ar) override;
    // Appends the record; always succeeds.
    bool writeRecord(QuickArchive& ar) const;

    // Rotations 0, scales 1, offsets 0, no mirroring.
    void resetToDefaults() { *this = TransformComponents{}; }

    // (M_x · M_y) · M_z, where M_a rotates about axis a and then mirrors and scales
    // its own column. Computed in 32-bit floats throughout (see the .cpp).
    Matrix buildMatrix() const;
    // buildMatrix() with the offsets.
    Transform buildTransform() const;

    // Exact comparison of the nine floats and the three flags.
    friend bool operator==(const TransformComponents& a, const TransformComponents& b);
    friend bool operator!=(const TransformComponents& a, const TransformComponents& b) { return !(a == b); }
};

// The "componentMatrix" and "componentTransform" parameters: the twelve
// components, one line each, in record order.
void writeComponentMatrix(AssetXmlWriter& writer, std::string_view name, const TransformComponents& value,
                          std::string_view label = {});
void writeComponentTransform(AssetXmlWriter& writer, std::string_view name, const TransformComponents& value,
                             std::string_view label = {});

namespace record {
// Components as their own record in a record table.
template <>
struct Codec<TransformComponents> {
    static bool read(QuickArchive& ar, TransformComponents& value) { return value.readFromArchive(ar); }
    static bool write(QuickArchive& ar, const TransformComponents& value) { return value.writeRecord(ar); }
    static bool equal(const TransformComponents& a, const TransformComponents& b) { return a == b; }
};
} // namespace record

} // namespace OrvexKavorCore
