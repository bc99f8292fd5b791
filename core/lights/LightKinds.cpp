// Records and XML parameters of the light kinds other than the sun light.
//
// Each record table lists the fields in the order of the current record; the
// versions of a row say which records hold it. Every older record is the current
// one with the newer rows left out.
#include <dexmor/lights/LightKinds.hpp>

#include <array>

namespace OrvexKavorCore {

// A row for the member of the same name; `Light` is the kind being described.
#define LIGHT_FIELD(member, ...) record::field<&Light::member>(#member __VA_OPT__(, ) __VA_ARGS__)
#define LIGHT_PARAM(member) lightxml::param<&Light::member>(#member)

namespace {

using record::between;
using record::since;

// --- directional light, record version 4 ---
// Version 2 stored the placement as a plain Transform, which becomes its value at
// time 0; version 3 stores the animated placement's own record.
namespace directional {
using Light = MayaDirectLight;

constexpr std::array kFields = {
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor, since(4)),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(md_f1),
    LIGHT_FIELD(md_f2),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(md_i1),
    LIGHT_FIELD(enabled),
    LIGHT_FIELD(shadows, since(2)),
    LIGHT_FIELD(shadowSubdivs, since(2)),
    LIGHT_FIELD(shadowRadius, since(2)),
    record::fieldAs<record::AnimatedPlainValue, &Light::transform>("transform (plain)", between(2, 2)),
    LIGHT_FIELD(transform, since(3)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(color),         LIGHT_PARAM(shadowColor),   LIGHT_PARAM(shadowBias),
    LIGHT_PARAM(shadowRadius),  LIGHT_PARAM(causticSubdivs), LIGHT_PARAM(photonSubdivs),
    LIGHT_PARAM(shadowSubdivs), LIGHT_PARAM(enabled),       LIGHT_PARAM(shadows),
};
} // namespace directional

// --- omni light, record version 4 ---
namespace omni {
using Light = OmniLight;

constexpr std::array kFields = {
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor, since(3)),
    LIGHT_FIELD(cutoffThreshold, since(3)),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(decay),
    LIGHT_FIELD(intensity),
    LIGHT_FIELD(omni_f1),
    LIGHT_FIELD(units, since(3)),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(omni_i1),
    LIGHT_FIELD(enabled),
    LIGHT_FIELD(shadows, since(2)),
    LIGHT_FIELD(shadowSubdivs, since(2)),
    LIGHT_FIELD(shadowRadius, since(2)),
    LIGHT_FIELD(transform, since(2)),
    LIGHT_FIELD(affectDiffuse, since(4)),
    LIGHT_FIELD(affectSpecular, since(4)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(color),         LIGHT_PARAM(shadowColor),    LIGHT_PARAM(cutoffThreshold),
    LIGHT_PARAM(shadowBias),    LIGHT_PARAM(decay),          LIGHT_PARAM(intensity),
    LIGHT_PARAM(shadowRadius),  LIGHT_PARAM(units),          LIGHT_PARAM(photonSubdivs),
    LIGHT_PARAM(causticSubdivs), LIGHT_PARAM(shadowSubdivs), LIGHT_PARAM(enabled),
    LIGHT_PARAM(shadows),       LIGHT_PARAM(affectDiffuse),  LIGHT_PARAM(affectSpecular),
    LIGHT_PARAM(transform),
};
} // namespace omni

// --- spot light, record version 4 ---
namespace spot {
using Light = SpotLight;

constexpr std::array kFields = {
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor, since(3)),
    LIGHT_FIELD(cutoffThreshold, since(3)),
    LIGHT_FIELD(barnDoorLeft, since(3)),
    LIGHT_FIELD(barnDoorRight, since(3)),
    LIGHT_FIELD(barnDoorTop, since(3)),
    LIGHT_FIELD(barnDoorBottom, since(3)),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(decay),
    LIGHT_FIELD(intensity),
    LIGHT_FIELD(spot_f1),
    LIGHT_FIELD(units, since(3)),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(spot_i1),
    LIGHT_FIELD(enabled),
    LIGHT_FIELD(barnDoor, since(3)),
    LIGHT_FIELD(shadows, since(2)),
    LIGHT_FIELD(shadowSubdivs, since(2)),
    LIGHT_FIELD(shadowRadius, since(2)),
    LIGHT_FIELD(transform, since(2)),
    LIGHT_FIELD(coneAngle, since(2)),
    LIGHT_FIELD(penumbraAngle, since(2)),
    LIGHT_FIELD(affectDiffuse, since(4)),
    LIGHT_FIELD(affectSpecular, since(4)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(color),          LIGHT_PARAM(shadowColor),   LIGHT_PARAM(cutoffThreshold),
    LIGHT_PARAM(barnDoorLeft),   LIGHT_PARAM(barnDoorRight), LIGHT_PARAM(barnDoorTop),
    LIGHT_PARAM(barnDoorBottom), LIGHT_PARAM(shadowBias),    LIGHT_PARAM(decay),
    LIGHT_PARAM(intensity),      LIGHT_PARAM(shadowRadius),  LIGHT_PARAM(coneAngle),
    LIGHT_PARAM(penumbraAngle),  LIGHT_PARAM(units),         LIGHT_PARAM(photonSubdivs),
    LIGHT_PARAM(causticSubdivs), LIGHT_PARAM(shadowSubdivs), LIGHT_PARAM(enabled),
    LIGHT_PARAM(barnDoor),       LIGHT_PARAM(shadows),       LIGHT_PARAM(affectDiffuse),
    LIGHT_PARAM(affectSpecular), LIGHT_PARAM(transform),
};
} // namespace spot

// --- rectangle light, record version 4 ---
namespace rectangle {
using Light = RectangleLight;

constexpr std::array kFields = {
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor, since(3)),
    LIGHT_FIELD(cutoffThreshold, since(3)),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(intensity),
    LIGHT_FIELD(rect_f1),
    LIGHT_FIELD(units, since(3)),
    LIGHT_FIELD(subdivs),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(rect_i1),
    LIGHT_FIELD(doubleSided),
    LIGHT_FIELD(invisible),
    LIGHT_FIELD(lightPortal),
    LIGHT_FIELD(noDecay),
    LIGHT_FIELD(enabled),
    LIGHT_FIELD(storeWithIrradianceMap),
    LIGHT_FIELD(ignoreLightNormals),
    LIGHT_FIELD(shadows, since(2)),
    LIGHT_FIELD(transform, since(2)),
    LIGHT_FIELD(u_size, since(2)),
    LIGHT_FIELD(v_size, since(2)),
    LIGHT_FIELD(affectDiffuse, since(4)),
    LIGHT_FIELD(affectSpecular, since(4)),
    LIGHT_FIELD(affectReflections, since(4)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(color),
    LIGHT_PARAM(shadowColor),
    LIGHT_PARAM(cutoffThreshold),
    LIGHT_PARAM(shadowBias),
    LIGHT_PARAM(intensity),
    LIGHT_PARAM(u_size),
    LIGHT_PARAM(v_size),
    LIGHT_PARAM(units),
    LIGHT_PARAM(photonSubdivs),
    LIGHT_PARAM(causticSubdivs),
    LIGHT_PARAM(subdivs),
    LIGHT_PARAM(enabled),
    LIGHT_PARAM(doubleSided),
    LIGHT_PARAM(invisible),
    LIGHT_PARAM(lightPortal),
    LIGHT_PARAM(noDecay),
    LIGHT_PARAM(storeWithIrradianceMap),
    LIGHT_PARAM(ignoreLightNormals),
    LIGHT_PARAM(shadows),
    LIGHT_PARAM(affectDiffuse),
    LIGHT_PARAM(affectSpecular),
    LIGHT_PARAM(affectReflections),
    LIGHT_PARAM(transform),
};
} // namespace rectangle

// --- IES light, record version 3 ---
namespace ies {
using Light = IESLight;

constexpr std::array kFields = {
    LIGHT_FIELD(transform),
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor),
    LIGHT_FIELD(filter_color),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(cutoffThreshold),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(shadow_subdivs),
    LIGHT_FIELD(enabled),
    LIGHT_FIELD(shadows),
    LIGHT_FIELD(soft_shadows),
    LIGHT_FIELD(ies_file),
    LIGHT_FIELD(affectDiffuse, since(2)),
    LIGHT_FIELD(affectSpecular, since(2)),
    LIGHT_FIELD(intensity, since(3)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(transform),      LIGHT_PARAM(color),          LIGHT_PARAM(shadowColor),
    LIGHT_PARAM(filter_color),   LIGHT_PARAM(shadowBias),     LIGHT_PARAM(cutoffThreshold),
    LIGHT_PARAM(intensity),      LIGHT_PARAM(photonSubdivs),  LIGHT_PARAM(causticSubdivs),
    LIGHT_PARAM(shadow_subdivs), LIGHT_PARAM(enabled),        LIGHT_PARAM(shadows),
    LIGHT_PARAM(soft_shadows),   LIGHT_PARAM(affectDiffuse),  LIGHT_PARAM(affectSpecular),
    LIGHT_PARAM(ies_file),
};
} // namespace ies

// --- sphere light, record version 2 (no XML) ---
namespace sphere {
using Light = SphereLight;

constexpr std::array kFields = {
    LIGHT_FIELD(transform),
    LIGHT_FIELD(color),
    LIGHT_FIELD(shadowColor),
    LIGHT_FIELD(sph_f1),
    LIGHT_FIELD(sph_f2),
    LIGHT_FIELD(sph_f3),
    LIGHT_FIELD(sph_f4),
    LIGHT_FIELD(sph_u1),
    LIGHT_FIELD(sph_u2),
    LIGHT_FIELD(sph_u3),
    LIGHT_FIELD(sph_u4),
    LIGHT_FIELD(sph_b1),
    LIGHT_FIELD(sph_b2),
    LIGHT_FIELD(sph_b3),
    LIGHT_FIELD(sph_b4),
    LIGHT_FIELD(sph_b5),
    LIGHT_FIELD(sph_b6, since(2)),
    LIGHT_FIELD(sph_b7, since(2)),
    LIGHT_FIELD(sph_b8, since(2)),
};
} // namespace sphere

} // namespace

#undef LIGHT_FIELD
#undef LIGHT_PARAM

std::span<const record::Field<MayaDirectLight>> MayaDirectLight::recordFields() { return directional::kFields; }
std::span<const lightxml::Parameter<MayaDirectLight>> MayaDirectLight::xmlParameters() { return directional::kXml; }

std::span<const record::Field<OmniLight>> OmniLight::recordFields() { return omni::kFields; }
std::span<const lightxml::Parameter<OmniLight>> OmniLight::xmlParameters() { return omni::kXml; }

std::span<const record::Field<SpotLight>> SpotLight::recordFields() { return spot::kFields; }
std::span<const lightxml::Parameter<SpotLight>> SpotLight::xmlParameters() { return spot::kXml; }

std::span<const record::Field<RectangleLight>> RectangleLight::recordFields() { return rectangle::kFields; }
std::span<const lightxml::Parameter<RectangleLight>> RectangleLight::xmlParameters() { return rectangle::kXml; }

std::span<const record::Field<IESLight>> IESLight::recordFields() { return ies::kFields; }
std::span<const lightxml::Parameter<IESLight>> IESLight::xmlParameters() { return ies::kXml; }

std::span<const record::Field<SphereLight>> SphereLight::recordFields() { return sphere::kFields; }
std::span<const lightxml::Parameter<SphereLight>> SphereLight::xmlParameters() { return {}; }

} // namespace OrvexKavorCore
