#pragma once
// The light kinds other than the sun light (lights/SunLight.hpp).
//
// Every kind stores its fields as one flat, versioned record. The record tables in
// LightKinds.cpp list the fields in stored order with the versions that hold them;
// the XML parameter lists there give the asset's parameters in emission order.
// Fields with a kind prefix and a number (md_f1, omni_i1, sph_b3, ...) have no XML
// parameter and are only carried through the record. Flags are stored as Bool
// bytes, counts as UInt32, other integers as Int32, real numbers as Float32.
#include <dexmor/lights/LightKind.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// An infinitely distant directional light. Its placement is animated.
class MayaDirectLight final : public LightKind<MayaDirectLight> {
public:
    static constexpr KindInfo kInfo{kMayaDirect, 4, "MayaLightDirect", "directional light"};
    static std::span<const record::Field<MayaDirectLight>> recordFields();
    static std::span<const kind::ParameterRow<MayaDirectLight>> xmlParameters();

    AnimatedTransform transform; // the identity at time 0
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    float shadowBias = 0.0f;
    float shadowRadius = 0.0f;
    float md_f1 = 1.0f;
    float md_f2 = 1.0f;
    std::uint32_t photonSubdivs = 500;
    std::uint32_t causticSubdivs = 1000;
    std::uint32_t shadowSubdivs = 8;
    std::int32_t md_i1 = 3;
    bool enabled = true;
    bool shadows = true;
};

// A point light shining in every direction.
class OmniLight final : public LightKind<OmniLight> {
public:
    static constexpr KindInfo kInfo{kOmni, 4, "LightOmni", "omni light"};
    static std::span<const record::Field<OmniLight>> recordFields();
    static std::span<const kind::ParameterRow<OmniLight>> xmlParameters();

    Transform transform = Transform::identity();
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    float cutoffThreshold = 0.005f;
    float shadowBias = 0.0f;
    float shadowRadius = 0.0f;
    float decay = 0.0f;
    float intensity = 30.0f;
    float omni_f1 = 1.0f;
    std::int32_t units = 0;
    std::uint32_t photonSubdivs = 500;
    std::uint32_t causticSubdivs = 1000;
    std::uint32_t shadowSubdivs = 8;
    std::int32_t omni_i1 = 3;
    bool enabled = true;
    bool shadows = true;
    bool affectDiffuse = true;
    bool affectSpecular = true;
};

// A cone of light with optional barn doors.
class SpotLight final : public LightKind<SpotLight> {
public:
    static constexpr KindInfo kInfo{kSpot, 4, "LightSpot", "spot light"};
    static std::span<const record::Field<SpotLight>> recordFields();
    static std::span<const kind::ParameterRow<SpotLight>> xmlParameters();

    Transform transform = Transform::identity();
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    float cutoffThreshold = 0.005f;
    float barnDoorLeft = 20.0f;
    float barnDoorRight = 20.0f;
    float barnDoorTop = 20.0f;
    float barnDoorBottom = 20.0f;
    float intensity = 50.0f;
    float decay = 0.0f;
    float shadowBias = 0.0f;
    float shadowRadius = 0.0f;
    float coneAngle = 1.0f;
    float penumbraAngle = 0.0f;
    float spot_f1 = 1.0f;
    std::int32_t units = 0;
    std::uint32_t photonSubdivs = 500;
    std::uint32_t causticSubdivs = 1000;
    std::uint32_t shadowSubdivs = 8;
    std::int32_t spot_i1 = 3;
    bool enabled = true;
    bool shadows = true;
    bool barnDoor = false;
    bool affectDiffuse = true;
    bool affectSpecular = true;
};

// An area light of u_size by v_size.
class RectangleLight final : public LightKind<RectangleLight> {
public:
    static constexpr KindInfo kInfo{kRectangle, 4, "LightRectangle", "rectangle light"};
    static std::span<const record::Field<RectangleLight>> recordFields();
    static std::span<const kind::ParameterRow<RectangleLight>> xmlParameters();

    Transform transform = Transform::identity();
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    float cutoffThreshold = 0.005f;
    float u_size = 1.0f;
    float v_size = 1.0f;
    float intensity = 30.0f;
    float shadowBias = 0.0f;
    float rect_f1 = 1.0f;
    std::int32_t units = 0;
    std::uint32_t subdivs = 8;
    std::uint32_t causticSubdivs = 1000;
    std::uint32_t photonSubdivs = 500;
    std::int32_t rect_i1 = 3;
    bool storeWithIrradianceMap = false;
    bool doubleSided = false;
    bool invisible = false;
    bool lightPortal = false;
    bool noDecay = false;
    bool ignoreLightNormals = true;
    bool enabled = true;
    bool shadows = true;
    bool affectDiffuse = true;
    bool affectSpecular = true;
    bool affectReflections = true;
};

// A photometric light whose distribution comes from an IES file.
class IESLight final : public LightKind<IESLight> {
public:
    static constexpr KindInfo kInfo{kIES, 3, "LightIES", "IES light"};
    static std::span<const record::Field<IESLight>> recordFields();
    static std::span<const kind::ParameterRow<IESLight>> xmlParameters();

    Transform transform = Transform::identity();
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    Color filter_color{1.0f, 1.0f, 1.0f};
    float shadowBias = 0.0f;
    float cutoffThreshold = 0.005f;
    float intensity = 1.0f;
    std::uint32_t photonSubdivs = 8;
    std::uint32_t causticSubdivs = 1000;
    std::uint32_t shadow_subdivs = 8;
    bool enabled = true;
    bool shadows = true;
    bool soft_shadows = false;
    std::string ies_file;
    bool affectDiffuse = true;
    bool affectSpecular = true;
};

// A spherical light. It is only stored: it has no plugin and writes no XML.
class SphereLight final : public LightKind<SphereLight> {
public:
    static constexpr KindInfo kInfo{kSphere, 2, "", "sphere light"};
    static std::span<const record::Field<SphereLight>> recordFields();
    static std::span<const kind::ParameterRow<SphereLight>> xmlParameters();

    Transform transform = Transform::identity();
    Color color{1.0f, 1.0f, 1.0f};
    Color shadowColor{0.0f, 0.0f, 0.0f};
    float sph_f1 = 0.0f;
    float sph_f2 = 0.005f;
    float sph_f3 = 1.0f;
    float sph_f4 = 1.0f;
    std::uint32_t sph_u1 = 500;
    std::uint32_t sph_u2 = 1000;
    std::uint32_t sph_u3 = 0;
    std::uint32_t sph_u4 = 8;
    bool sph_b1 = true;
    bool sph_b2 = true;
    bool sph_b3 = false;
    bool sph_b4 = false;
    bool sph_b5 = false;
    bool sph_b6 = true;
    bool sph_b7 = true;
    bool sph_b8 = true;
};

} // namespace OrvexKavorCore
