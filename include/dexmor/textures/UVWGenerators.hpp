#pragma once
// The four UVW generator kinds. Each keeps its transform twice: as a Transform (or
// Matrix) and as TransformComponents (rotations, scales, offsets, mirror flags).
// The components are authoritative: updateTransforms() rebuilds the other form
// from them, and writeXml() runs it before writing. The archive stores both forms
// as they stand.
//
// Records, after the VersionWord (0, version):
//   GenPlanarWorldUVW, GenObjectUVW (version 1):
//       Transform uvwTransform; components uvwComponents
//   GenEnvironmentUVW (version 2):
//       Matrix uvwMatrix; Int32 mappingType; components uvwComponents
//   GenChannelUVW (version 2):
//       Transform uvwTransform; Transform texTransform;
//       Int32 wrap_u, wrap_v, uvw_channel; components uvwComponents; components texComponents
// "components" is the TransformComponents record. The version-1 layouts of the
// environment and channel generators are described at their readers.
#include <dexmor/params/TransformComponents.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/textures/BaseUVW.hpp>

#include <cstdint>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// What the planar world and object generators share: one transform and the
// components it is built from.
class GenProjectionUVW : public BaseUVW {
public:
    Transform uvwTransform = Transform::identity();
    TransformComponents uvwComponents;

    bool writeToArchive(QuickArchive& ar) override;
    // Does not reset first.
    bool readFromArchive(QuickArchive& ar) override;
    void updateTransforms() override;
    void writeXml(AssetXmlWriter& writer, std::string url) override;

protected:
    bool sameFields(const GenProjectionUVW& other) const;
};

// Projects world coordinates onto a plane.
class GenPlanarWorldUVW final : public GenProjectionUVW {
public:
    std::int32_t kindId() const override { return kPlanarWorld; }
    std::string pluginType() const override { return "UVWGenPlanarWorld"; }
    void resetToDefaults() override { *this = GenPlanarWorldUVW{}; }
    UVWPtr clone() const override;
    bool isEqual(const UVWPtr& other) const override;
};

// Projects object coordinates.
class GenObjectUVW final : public GenProjectionUVW {
public:
    std::int32_t kindId() const override { return kObject; }
    std::string pluginType() const override { return "UVWGenObject"; }
    // The only generator that resets before it reads, even when the version is refused.
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override { *this = GenObjectUVW{}; }
    UVWPtr clone() const override;
    bool isEqual(const UVWPtr& other) const override;
};

// Maps directions for environment lookups.
class GenEnvironmentUVW final : public BaseUVW {
public:
    enum MappingType : std::int32_t { kAngular = 0, kCubic = 1, kSpherical = 2, kMirrorBall = 3 };

    std::int32_t mappingType = kSpherical;
    Matrix uvwMatrix = Matrix::identity();
    TransformComponents uvwComponents;

    bool writeToArchive(QuickArchive& ar) override;
    // Reads versions 1 and 2; does not reset first.
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override { *this = GenEnvironmentUVW{}; }
    std::int32_t kindId() const override { return kEnvironment; }
    void updateTransforms() override;
    UVWPtr clone() const override;
    bool isEqual(const UVWPtr& other) const override;

    // "mapping_type" holds the name of the mapping type; a value outside the
    // table writes the empty text.
    void writeXml(AssetXmlWriter& writer, std::string url) override;
    std::string pluginType() const override { return "UVWGenEnvironment"; }
};

// Reads a mapping channel of the geometry.
class GenChannelUVW final : public BaseUVW {
public:
    Transform uvwTransform = Transform::identity();
    Transform texTransform = Transform::identity();
    TransformComponents uvwComponents;
    TransformComponents texComponents;
    std::int32_t wrap_u = 0;
    std::int32_t wrap_v = 0;
    std::int32_t uvw_channel = 1;

    bool writeToArchive(QuickArchive& ar) override;
    // Reads versions 1 and 2; does not reset first.
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override { *this = GenChannelUVW{}; }
    std::int32_t kindId() const override { return kChannel; }
    void updateTransforms() override;
    UVWPtr clone() const override;
    bool isEqual(const UVWPtr& other) const override;

    void writeXml(AssetXmlWriter& writer, std::string url) override;
    std::string pluginType() const override { return "UVWGenChannel"; }
};

// The name of an environment mapping type ("angular", "cubic", "spherical",
// "mirror_ball"); the empty text for a value outside the table.
std::string_view environmentMappingName(std::int32_t mappingType);

} // namespace OrvexKavorCore
