#pragma once
// The editable form of a transform: rotations in degrees, scales, offsets and
// mirror flags per axis.
#include "archive/Serializable.hpp"
#include "platform/KavorTypes.hpp"

#include <cstdint>

namespace OrvexKavorCore {

class TransformComponents : public OrvexSerializable {
public:
    float x_rotation = 0.0f, y_rotation = 0.0f, z_rotation = 0.0f;
    float x_scale = 1.0f, y_scale = 1.0f, z_scale = 1.0f;
    float x_offset = 0.0f, y_offset = 0.0f, z_offset = 0.0f;
    std::int32_t x_mirror = 0, y_mirror = 0, z_mirror = 0;

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;

    Matrix buildMatrix() const;
    Transform buildTransform() const;

    friend bool operator==(const TransformComponents& a, const TransformComponents& b);
};

} // namespace OrvexKavorCore
