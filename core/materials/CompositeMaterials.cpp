#include <dexmor/materials/CompositeMaterials.hpp>

#include <algorithm>
#include <array>

namespace OrvexKavorCore {

namespace {

using kind::baseRecord;
using kind::reference;
using kind::value;
using material::nameItem;
using material::subMaterial;
using record::between;
using record::field;
using record::since;

constexpr std::array kMultiFields = {
    replay::listRow<&MaterialMulti::subMaterials, &MaterialMulti::replayedSubMaterials>("subMaterials"),
    nameItem<MaterialMulti>(between(1, 1)),
    baseRecord<MaterialMulti>(since(2)),
};

constexpr std::array k2SidedFields = {
    field<&Material2Sided::front>("front"),
    field<&Material2Sided::back>("back"),
    field<&Material2Sided::translucencyTex>("translucency_tex"),
    field<&Material2Sided::translucency>("translucency"),
    field<&Material2Sided::translucencyTexMult>("translucency_tex_mult"),
    field<&Material2Sided::force1Sided>("force_1sided"),
    field<&Material2Sided::transparencyTex>("transparency_tex", since(2)),
    field<&Material2Sided::transparency>("transparency", since(2)),
    field<&Material2Sided::transparencyTexMult>("transparency_tex_mult", since(2)),
    baseRecord<Material2Sided>(since(3)),
};

constexpr std::array k2SidedParameters = {
    subMaterial<&Material2Sided::front>("front"),
    subMaterial<&Material2Sided::back>("back"),
    reference<&Material2Sided::translucencyTex>("translucency_tex", "translucency_tex"),
    reference<&Material2Sided::transparencyTex>("transparency_tex", "transparency_tex"),
    value<&Material2Sided::translucency>("translucency"),
    value<&Material2Sided::transparency>("transparency"),
    value<&Material2Sided::translucencyTexMult>("translucency_tex_mult"),
    value<&Material2Sided::transparencyTexMult>("transparency_tex_mult"),
    value<&Material2Sided::force1Sided>("force_1sided"),
};

constexpr std::array kSkp2SidedFields = {
    baseRecord<MaterialSkp2Sided>(),
    field<&MaterialSkp2Sided::front>("front"),
    field<&MaterialSkp2Sided::back>("back"),
    field<&MaterialSkp2Sided::force1Sided>("force_1sided"),
};

constexpr std::array kSkp2SidedParameters = {
    subMaterial<&MaterialSkp2Sided::front>("front"),
    subMaterial<&MaterialSkp2Sided::back>("back"),
    value<&MaterialSkp2Sided::force1Sided>("force_1sided"),
};

constexpr std::array kAngleBlendFields = {
    baseRecord<MaterialAngleBlend>(),
    field<&MaterialAngleBlend::mtlOne>("mtl_one"),
    field<&MaterialAngleBlend::mtlTwo>("mtl_two"),
    field<&MaterialAngleBlend::startAngle>("start_angle"),
    field<&MaterialAngleBlend::stopAngle>("stop_angle"),
};

constexpr std::array kAngleBlendParameters = {
    subMaterial<&MaterialAngleBlend::mtlOne>("mtl_one"),
    subMaterial<&MaterialAngleBlend::mtlTwo>("mtl_two"),
    value<&MaterialAngleBlend::startAngle>("start_angle"),
    value<&MaterialAngleBlend::stopAngle>("stop_angle"),
};

} // namespace

// --- MaterialMulti ---

std::span<const record::Field<MaterialMulti>> MaterialMulti::fields() { return kMultiFields; }

bool MaterialMulti::canBeWritten() const {
    return std::all_of(subMaterials.begin(), subMaterials.end(), [](const MaterialPtr& m) { return bool(m); });
}

void MaterialMulti::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    for (MaterialPtr& m : subMaterials) material::take(m, out);
    subMaterials.clear();
}

// --- Material2Sided ---

std::span<const record::Field<Material2Sided>> Material2Sided::fields() { return k2SidedFields; }
std::span<const kind::ParameterRow<Material2Sided>> Material2Sided::parameters() { return k2SidedParameters; }

bool Material2Sided::separate(bool renamed) {
    return material::copyMember(front, renamed) && material::copyMember(back, renamed);
}

void Material2Sided::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(front, out);
    material::take(back, out);
}

// --- MaterialSkp2Sided ---

std::span<const record::Field<MaterialSkp2Sided>> MaterialSkp2Sided::fields() { return kSkp2SidedFields; }
std::span<const kind::ParameterRow<MaterialSkp2Sided>> MaterialSkp2Sided::parameters() {
    return kSkp2SidedParameters;
}

bool MaterialSkp2Sided::separate(bool renamed) {
    return material::copyMember(front, renamed) && material::copyMember(back, renamed);
}

void MaterialSkp2Sided::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(front, out);
    material::take(back, out);
}

// --- MaterialAngleBlend ---

std::span<const record::Field<MaterialAngleBlend>> MaterialAngleBlend::fields() { return kAngleBlendFields; }
std::span<const kind::ParameterRow<MaterialAngleBlend>> MaterialAngleBlend::parameters() {
    return kAngleBlendParameters;
}

bool MaterialAngleBlend::separate(bool renamed) {
    return material::copyMember(mtlOne, renamed) && material::copyMember(mtlTwo, renamed);
}

void MaterialAngleBlend::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(mtlOne, out);
    material::take(mtlTwo, out);
}

} // namespace OrvexKavorCore
