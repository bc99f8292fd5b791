// Records and XML parameters of the light kinds other than the sun light.
//
// Each record table lists the fields in the order of the current record; the
// versions of a row say which records hold it. Every older record is the current
// one with the newer rows left out.
#include <dexmor/lights/LightKinds.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using kind::value;
using record::between;
using record::field;
using record::since;

// --- directional light, record version 4 ---
// Version 2 stored the placement as a plain Transform, which becomes its value at
// time 0; version 3 stores the animated placement's own record.
namespace directional {

constexpr std::array kFields = {
    field<&MayaDirectLight::color>("color"),
    field<&MayaDirectLight::shadowColor>("shadowColor", since(4)),
    field<&MayaDirectLight::shadowBias>("shadowBias"),
    field<&MayaDirectLight::md_f1>("md_f1"),
    field<&MayaDirectLight::md_f2>("md_f2"),
    field<&MayaDirectLight::causticSubdivs>("causticSubdivs"),
    field<&MayaDirectLight::photonSubdivs>("photonSubdivs"),
    field<&MayaDirectLight::md_i1>("md_i1"),
    field<&MayaDirectLight::enabled>("enabled"),
    field<&MayaDirectLight::shadows>("shadows", since(2)),
    field<&MayaDirectLight::shadowSubdivs>("shadowSubdivs", since(2)),
    field<&MayaDirectLight::shadowRadius>("shadowRadius", since(2)),
    record::fieldAs<record::AnimatedPlainValue, &MayaDirectLight::transform>("transform (plain)", between(2, 2)),
    field<&MayaDirectLight::transform>("transform", since(3)),
};

constexpr std::array kXml = {
    value<&MayaDirectLight::color>("color"),
    value<&MayaDirectLight::shadowColor>("shadowColor"),
    value<&MayaDirectLight::shadowBias>("shadowBias"),
    value<&MayaDirectLight::shadowRadius>("shadowRadius"),
    value<&MayaDirectLight::causticSubdivs>("causticSubdivs"),
    value<&MayaDirectLight::photonSubdivs>("photonSubdivs"),
    value<&MayaDirectLight::shadowSubdivs>("shadowSubdivs"),
    value<&MayaDirectLight::enabled>("enabled"),
    value<&MayaDirectLight::shadows>("shadows"),
};
} // namespace directional

// --- omni light, record version 4 ---
namespace omni {

constexpr std::array kFields = {
    field<&OmniLight::color>("color"),
    field<&OmniLight::shadowColor>("shadowColor", since(3)),
    field<&OmniLight::cutoffThreshold>("cutoffThreshold", since(3)),
    field<&OmniLight::shadowBias>("shadowBias"),
    field<&OmniLight::decay>("decay"),
    field<&OmniLight::intensity>("intensity"),
    field<&OmniLight::omni_f1>("omni_f1"),
    field<&OmniLight::units>("units", since(3)),
    field<&OmniLight::photonSubdivs>("photonSubdivs"),
    field<&OmniLight::causticSubdivs>("causticSubdivs"),
    field<&OmniLight::omni_i1>("omni_i1"),
    field<&OmniLight::enabled>("enabled"),
    field<&OmniLight::shadows>("shadows", since(2)),
    field<&OmniLight::shadowSubdivs>("shadowSubdivs", since(2)),
    field<&OmniLight::shadowRadius>("shadowRadius", since(2)),
    field<&OmniLight::transform>("transform", since(2)),
    field<&OmniLight::affectDiffuse>("affectDiffuse", since(4)),
    field<&OmniLight::affectSpecular>("affectSpecular", since(4)),
};

constexpr std::array kXml = {
    value<&OmniLight::color>("color"),
    value<&OmniLight::shadowColor>("shadowColor"),
    value<&OmniLight::cutoffThreshold>("cutoffThreshold"),
    value<&OmniLight::shadowBias>("shadowBias"),
    value<&OmniLight::decay>("decay"),
    value<&OmniLight::intensity>("intensity"),
    value<&OmniLight::shadowRadius>("shadowRadius"),
    value<&OmniLight::units>("units"),
    value<&OmniLight::photonSubdivs>("photonSubdivs"),
    value<&OmniLight::causticSubdivs>("causticSubdivs"),
    value<&OmniLight::shadowSubdivs>("shadowSubdivs"),
    value<&OmniLight::enabled>("enabled"),
    value<&OmniLight::shadows>("shadows"),
    value<&OmniLight::affectDiffuse>("affectDiffuse"),
    value<&OmniLight::affectSpecular>("affectSpecular"),
    value<&OmniLight::transform>("transform"),
};
} // namespace omni

// --- spot light, record version 4 ---
namespace spot {

constexpr std::array kFields = {
    field<&SpotLight::color>("color"),
    field<&SpotLight::shadowColor>("shadowColor", since(3)),
    field<&SpotLight::cutoffThreshold>("cutoffThreshold", since(3)),
    field<&SpotLight::barnDoorLeft>("barnDoorLeft", since(3)),
    field<&SpotLight::barnDoorRight>("barnDoorRight", since(3)),
    field<&SpotLight::barnDoorTop>("barnDoorTop", since(3)),
    field<&SpotLight::barnDoorBottom>("barnDoorBottom", since(3)),
    field<&SpotLight::shadowBias>("shadowBias"),
    field<&SpotLight::decay>("decay"),
    field<&SpotLight::intensity>("intensity"),
    field<&SpotLight::spot_f1>("spot_f1"),
    field<&SpotLight::units>("units", since(3)),
    field<&SpotLight::photonSubdivs>("photonSubdivs"),
    field<&SpotLight::causticSubdivs>("causticSubdivs"),
    field<&SpotLight::spot_i1>("spot_i1"),
    field<&SpotLight::enabled>("enabled"),
    field<&SpotLight::barnDoor>("barnDoor", since(3)),
    field<&SpotLight::shadows>("shadows", since(2)),
    field<&SpotLight::shadowSubdivs>("shadowSubdivs", since(2)),
    field<&SpotLight::shadowRadius>("shadowRadius", since(2)),
    field<&SpotLight::transform>("transform", since(2)),
    field<&SpotLight::coneAngle>("coneAngle", since(2)),
    field<&SpotLight::penumbraAngle>("penumbraAngle", since(2)),
    field<&SpotLight::affectDiffuse>("affectDiffuse", since(4)),
    field<&SpotLight::affectSpecular>("affectSpecular", since(4)),
};

constexpr std::array kXml = {
    value<&SpotLight::color>("color"),
    value<&SpotLight::shadowColor>("shadowColor"),
    value<&SpotLight::cutoffThreshold>("cutoffThreshold"),
    value<&SpotLight::barnDoorLeft>("barnDoorLeft"),
    value<&SpotLight::barnDoorRight>("barnDoorRight"),
    value<&SpotLight::barnDoorTop>("barnDoorTop"),
    value<&SpotLight::barnDoorBottom>("barnDoorBottom"),
    value<&SpotLight::shadowBias>("shadowBias"),
    value<&SpotLight::decay>("decay"),
    value<&SpotLight::intensity>("intensity"),
    value<&SpotLight::shadowRadius>("shadowRadius"),
    value<&SpotLight::coneAngle>("coneAngle"),
    value<&SpotLight::penumbraAngle>("penumbraAngle"),
    value<&SpotLight::units>("units"),
    value<&SpotLight::photonSubdivs>("photonSubdivs"),
    value<&SpotLight::causticSubdivs>("causticSubdivs"),
    value<&SpotLight::shadowSubdivs>("shadowSubdivs"),
    value<&SpotLight::enabled>("enabled"),
    value<&SpotLight::barnDoor>("barnDoor"),
    value<&SpotLight::shadows>("shadows"),
    value<&SpotLight::affectDiffuse>("affectDiffuse"),
    value<&SpotLight::affectSpecular>("affectSpecular"),
    value<&SpotLight::transform>("transform"),
};
} // namespace spot

// --- rectangle light, record version 4 ---
namespace rectangle {

constexpr std::array kFields = {
    field<&RectangleLight::color>("color"),
    field<&RectangleLight::shadowColor>("shadowColor", since(3)),
    field<&RectangleLight::cutoffThreshold>("cutoffThreshold", since(3)),
    field<&RectangleLight::shadowBias>("shadowBias"),
    field<&RectangleLight::intensity>("intensity"),
    field<&RectangleLight::rect_f1>("rect_f1"),
    field<&RectangleLight::units>("units", since(3)),
    field<&RectangleLight::subdivs>("subdivs"),
    field<&RectangleLight::causticSubdivs>("causticSubdivs"),
    field<&RectangleLight::photonSubdivs>("photonSubdivs"),
    field<&RectangleLight::rect_i1>("rect_i1"),
    field<&RectangleLight::doubleSided>("doubleSided"),
    field<&RectangleLight::invisible>("invisible"),
    field<&RectangleLight::lightPortal>("lightPortal"),
    field<&RectangleLight::noDecay>("noDecay"),
    field<&RectangleLight::enabled>("enabled"),
    field<&RectangleLight::storeWithIrradianceMap>("storeWithIrradianceMap"),
    field<&RectangleLight::ignoreLightNormals>("ignoreLightNormals"),
    field<&RectangleLight::shadows>("shadows", since(2)),
    field<&RectangleLight::transform>("transform", since(2)),
    field<&RectangleLight::u_size>("u_size", since(2)),
    field<&RectangleLight::v_size>("v_size", since(2)),
    field<&RectangleLight::affectDiffuse>("affectDiffuse", since(4)),
    field<&RectangleLight::affectSpecular>("affectSpecular", since(4)),
    field<&RectangleLight::affectReflections>("affectReflections", since(4)),
};

constexpr std::array kXml = {
    value<&RectangleLight::color>("color"),
    value<&RectangleLight::shadowColor>("shadowColor"),
    value<&RectangleLight::cutoffThreshold>("cutoffThreshold"),
    value<&RectangleLight::shadowBias>("shadowBias"),
    value<&RectangleLight::intensity>("intensity"),
    value<&RectangleLight::u_size>("u_size"),
    value<&RectangleLight::v_size>("v_size"),
    value<&RectangleLight::units>("units"),
    value<&RectangleLight::photonSubdivs>("photonSubdivs"),
    value<&RectangleLight::causticSubdivs>("causticSubdivs"),
    value<&RectangleLight::subdivs>("subdivs"),
    value<&RectangleLight::enabled>("enabled"),
    value<&RectangleLight::doubleSided>("doubleSided"),
    value<&RectangleLight::invisible>("invisible"),
    value<&RectangleLight::lightPortal>("lightPortal"),
    value<&RectangleLight::noDecay>("noDecay"),
    value<&RectangleLight::storeWithIrradianceMap>("storeWithIrradianceMap"),
    value<&RectangleLight::ignoreLightNormals>("ignoreLightNormals"),
    value<&RectangleLight::shadows>("shadows"),
    value<&RectangleLight::affectDiffuse>("affectDiffuse"),
    value<&RectangleLight::affectSpecular>("affectSpecular"),
    value<&RectangleLight::affectReflections>("affectReflections"),
    value<&RectangleLight::transform>("transform"),
};
} // namespace rectangle

// --- IES light, record version 3 ---
namespace ies {

constexpr std::array kFields = {
    field<&IESLight::transform>("transform"),
    field<&IESLight::color>("color"),
    field<&IESLight::shadowColor>("shadowColor"),
    field<&IESLight::filter_color>("filter_color"),
    field<&IESLight::shadowBias>("shadowBias"),
    field<&IESLight::cutoffThreshold>("cutoffThreshold"),
    field<&IESLight::photonSubdivs>("photonSubdivs"),
    field<&IESLight::causticSubdivs>("causticSubdivs"),
    field<&IESLight::shadow_subdivs>("shadow_subdivs"),
    field<&IESLight::enabled>("enabled"),
    field<&IESLight::shadows>("shadows"),
    field<&IESLight::soft_shadows>("soft_shadows"),
    field<&IESLight::ies_file>("ies_file"),
    field<&IESLight::affectDiffuse>("affectDiffuse", since(2)),
    field<&IESLight::affectSpecular>("affectSpecular", since(2)),
    field<&IESLight::intensity>("intensity", since(3)),
};

constexpr std::array kXml = {
    value<&IESLight::transform>("transform"),
    value<&IESLight::color>("color"),
    value<&IESLight::shadowColor>("shadowColor"),
    value<&IESLight::filter_color>("filter_color"),
    value<&IESLight::shadowBias>("shadowBias"),
    value<&IESLight::cutoffThreshold>("cutoffThreshold"),
    value<&IESLight::intensity>("intensity"),
    value<&IESLight::photonSubdivs>("photonSubdivs"),
    value<&IESLight::causticSubdivs>("causticSubdivs"),
    value<&IESLight::shadow_subdivs>("shadow_subdivs"),
    value<&IESLight::enabled>("enabled"),
    value<&IESLight::shadows>("shadows"),
    value<&IESLight::soft_shadows>("soft_shadows"),
    value<&IESLight::affectDiffuse>("affectDiffuse"),
    value<&IESLight::affectSpecular>("affectSpecular"),
    value<&IESLight::ies_file>("ies_file"),
};
} // namespace ies

// --- sphere light, record version 2 (no XML) ---
namespace sphere {

constexpr std::array kFields = {
    field<&SphereLight::transform>("transform"),
    field<&SphereLight::color>("color"),
    field<&SphereLight::shadowColor>("shadowColor"),
    field<&SphereLight::sph_f1>("sph_f1"),
    field<&SphereLight::sph_f2>("sph_f2"),
    field<&SphereLight::sph_f3>("sph_f3"),
    field<&SphereLight::sph_f4>("sph_f4"),
    field<&SphereLight::sph_u1>("sph_u1"),
    field<&SphereLight::sph_u2>("sph_u2"),
    field<&SphereLight::sph_u3>("sph_u3"),
    field<&SphereLight::sph_u4>("sph_u4"),
    field<&SphereLight::sph_b1>("sph_b1"),
    field<&SphereLight::sph_b2>("sph_b2"),
    field<&SphereLight::sph_b3>("sph_b3"),
    field<&SphereLight::sph_b4>("sph_b4"),
    field<&SphereLight::sph_b5>("sph_b5"),
    field<&SphereLight::sph_b6>("sph_b6", since(2)),
    field<&SphereLight::sph_b7>("sph_b7", since(2)),
    field<&SphereLight::sph_b8>("sph_b8", since(2)),
};
} // namespace sphere

} // namespace

std::span<const record::Field<MayaDirectLight>> MayaDirectLight::recordFields() { return directional::kFields; }
std::span<const kind::ParameterRow<MayaDirectLight>> MayaDirectLight::xmlParameters() { return directional::kXml; }

std::span<const record::Field<OmniLight>> OmniLight::recordFields() { return omni::kFields; }
std::span<const kind::ParameterRow<OmniLight>> OmniLight::xmlParameters() { return omni::kXml; }

std::span<const record::Field<SpotLight>> SpotLight::recordFields() { return spot::kFields; }
std::span<const kind::ParameterRow<SpotLight>> SpotLight::xmlParameters() { return spot::kXml; }

std::span<const record::Field<RectangleLight>> RectangleLight::recordFields() { return rectangle::kFields; }
std::span<const kind::ParameterRow<RectangleLight>> RectangleLight::xmlParameters() { return rectangle::kXml; }

std::span<const record::Field<IESLight>> IESLight::recordFields() { return ies::kFields; }
std::span<const kind::ParameterRow<IESLight>> IESLight::xmlParameters() { return ies::kXml; }

std::span<const record::Field<SphereLight>> SphereLight::recordFields() { return sphere::kFields; }
std::span<const kind::ParameterRow<SphereLight>> SphereLight::xmlParameters() { return {}; }

} // namespace OrvexKavorCore
