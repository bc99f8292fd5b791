#include <dexmor/materials/WrapperMaterials.hpp>

#include <dexmor/textures/TextureFunctions.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using kind::baseRecord;
using kind::reference;
using kind::value;
using material::copyMember;
using material::subMaterial;
using record::field;
using record::since;

// --- bump: the current record (older ones are read by hand) ---

constexpr std::array kBumpFields = {
    field<&MaterialBump::bumpTexMult>("bumpTexMult"),
    field<&MaterialBump::bumpTex>("bumpTex"),
    record::fieldAs<material::Required<MaterialPtr>, &MaterialBump::baseMtl>("baseMtl"),
    baseRecord<MaterialBump>(),
};

constexpr std::array kBumpParameters = {
    value<&MaterialBump::bumpTexMult>("bump_tex_mult"),
    subMaterial<&MaterialBump::baseMtl>("base_mtl"),
    reference<&MaterialBump::bumpTex>("bump_tex", "bump_tex"),
};

constexpr std::array kDisplacedFields = {
    baseRecord<MaterialDisplaced>(),
    field<&MaterialDisplaced::baseMtl>("baseMtl"),
    field<&MaterialDisplaced::displaceTex>("displaceTex"),
    field<&MaterialDisplaced::displaceTexMult>("displaceTexMult"),
    field<&MaterialDisplaced::displaceShift>("displaceShift", since(2)),
    field<&MaterialDisplaced::displaceEdgeLength>("displaceEdgeLength", since(2)),
    field<&MaterialDisplaced::displaceMaxSubdivs>("displaceMaxSubdivs", since(2)),
    field<&MaterialDisplaced::displaceContinuity>("displaceContinuity", since(2)),
    field<&MaterialDisplaced::displaceViewDependent>("displaceViewDependent", since(2)),
    field<&MaterialDisplaced::displaceUseGlobals>("displaceUseGlobals", since(2)),
};

constexpr std::array kOverrideFields = {
    baseRecord<MaterialOverrideEnvironment>(),
    field<&MaterialOverrideEnvironment::baseMtl>("baseMtl"),
    field<&MaterialOverrideEnvironment::bgTex>("bgTex"),
    field<&MaterialOverrideEnvironment::giTex>("giTex"),
    field<&MaterialOverrideEnvironment::reflectTex>("reflectTex"),
    field<&MaterialOverrideEnvironment::refractTex>("refractTex"),
    field<&MaterialOverrideEnvironment::bgColor>("bgColor"),
    field<&MaterialOverrideEnvironment::giColor>("giColor"),
    field<&MaterialOverrideEnvironment::reflectColor>("reflectColor"),
    field<&MaterialOverrideEnvironment::refractColor>("refractColor"),
    field<&MaterialOverrideEnvironment::bgTexMult>("bgTexMult"),
    field<&MaterialOverrideEnvironment::giTexMult>("giTexMult"),
    field<&MaterialOverrideEnvironment::reflectTexMult>("reflectTexMult"),
    field<&MaterialOverrideEnvironment::refractTexMult>("refractTexMult"),
    field<&MaterialOverrideEnvironment::overrideBg>("overrideBg"),
    field<&MaterialOverrideEnvironment::overrideGi>("overrideGi"),
    field<&MaterialOverrideEnvironment::overrideReflect>("overrideReflect"),
    field<&MaterialOverrideEnvironment::overrideRefract>("overrideRefract"),
};

constexpr std::array kExclusionFields = {
    field<&MaterialObjectExclusion::mode>("mode"),
    field<&MaterialObjectExclusion::baseMtl>("baseMtl"),
    field<&MaterialObjectExclusion::objects>("objects"),
    baseRecord<MaterialObjectExclusion>(since(2)),
    field<&MaterialObjectExclusion::shortCircuit>("shortCircuit", since(3)),
};

constexpr std::array kExclusionParameters = {
    subMaterial<&MaterialObjectExclusion::baseMtl>("base_mtl"),
    value<&MaterialObjectExclusion::mode>("mode"),
    value<&MaterialObjectExclusion::shortCircuit>("short_circuit"),
    // The object names: a "string" list.
    kind::ParameterRow<MaterialObjectExclusion>{
        "objects", nullptr, nullptr, nullptr,
        [](AssetXmlWriter& w, const char* n, const MaterialObjectExclusion& o, const std::string&) {
            w.beginList(n, "string");
            for (const std::string& object : o.objects) w.writeStringEntry(object);
            w.endList();
        }},
};

constexpr std::array kAlphaFields = {
    baseRecord<MaterialAlphaContribution>(),
    field<&MaterialAlphaContribution::baseMtl>("baseMtl"),
    field<&MaterialAlphaContribution::alphaTex>("alphaTex"),
    field<&MaterialAlphaContribution::alphaTexMult>("alphaTexMult"),
    field<&MaterialAlphaContribution::alpha>("alpha"),
};

constexpr std::array kAlphaParameters = {
    value<&MaterialAlphaContribution::alpha>("alpha"),
    value<&MaterialAlphaContribution::alphaTexMult>("alpha_tex_mult"),
    subMaterial<&MaterialAlphaContribution::baseMtl>("base_mtl"),
    reference<&MaterialAlphaContribution::alphaTex>("alpha_tex", "alpha_tex"),
};

constexpr std::array kToonFields = {
    field<&MaterialToon::baseMtl>("baseMtl"),
    field<&MaterialToon::lineWidth>("lineWidth"),
    field<&MaterialToon::lineWidthTexMult>("lineWidthTexMult"),
    field<&MaterialToon::lineWidthTex>("lineWidthTex"),
    field<&MaterialToon::opacity>("opacity"),
    field<&MaterialToon::opacityTexMult>("opacityTexMult"),
    field<&MaterialToon::opacityTex>("opacityTex"),
    field<&MaterialToon::distort>("distort"),
    field<&MaterialToon::distortTexMult>("distortTexMult"),
    field<&MaterialToon::distortTex>("distortTex"),
    field<&MaterialToon::lineColor>("lineColor"),
    field<&MaterialToon::lineColorTexMult>("lineColorTexMult"),
    field<&MaterialToon::lineColorTex>("lineColorTex"),
    field<&MaterialToon::zThreshold>("zThreshold"),
    field<&MaterialToon::traceBias>("traceBias"),
    field<&MaterialToon::normalThreshold>("normalThreshold"),
    field<&MaterialToon::lineUnits>("lineUnits"),
    field<&MaterialToon::doSecondary>("doSecondary"),
    field<&MaterialToon::divideByDist>("divideByDist"),
    baseRecord<MaterialToon>(),
    field<&MaterialToon::doSilhouetteMult>("doSilhouetteMult", since(2)),
    field<&MaterialToon::silhouetteMult>("silhouetteMult", since(2)),
};

// The unfolded asset; the folded one (MaterialAssets.cpp) names the same
// parameters otherwise.
constexpr std::array kToonParameters = {
    subMaterial<&MaterialToon::baseMtl>("base_mtl"),
    reference<&MaterialToon::lineColorTex>("color_tex", "color_tex"),
    reference<&MaterialToon::distortTex>("distort_tex", "distort_tex"),
    reference<&MaterialToon::opacityTex>("opacity_tex", "opacity_tex"),
    reference<&MaterialToon::lineWidthTex>("width_tex", "width_tex"),
    value<&MaterialToon::lineColor>("color"),
    value<&MaterialToon::lineColorTexMult>("color_tex_mult"),
    value<&MaterialToon::distort>("distort"),
    value<&MaterialToon::distortTexMult>("distort_tex_mult"),
    value<&MaterialToon::opacity>("opacity"),
    value<&MaterialToon::opacityTexMult>("opacity_tex_mult"),
    value<&MaterialToon::lineWidth>("width"),
    value<&MaterialToon::lineWidthTexMult>("width_tex_mult"),
    value<&MaterialToon::zThreshold>("z_threshold"),
    value<&MaterialToon::traceBias>("trace_bias"),
    value<&MaterialToon::normalThreshold>("normal_threshold"),
    value<&MaterialToon::lineUnits>("line_units"),
    value<&MaterialToon::silhouetteMult>("silhouette_mult"),
    value<&MaterialToon::doSecondary>("do_secondary"),
    value<&MaterialToon::divideByDist>("divide_by_distance"),
    value<&MaterialToon::doSilhouetteMult>("do_silhouette_mult"),
};

} // namespace

// --- MaterialBump ---

std::span<const record::Field<MaterialBump>> MaterialBump::fields() { return kBumpFields; }
std::span<const kind::ParameterRow<MaterialBump>> MaterialBump::parameters() { return kBumpParameters; }

bool MaterialBump::readVersion(QuickArchive& ar, unsigned version) {
    if (version == 1) {
        // The texture was a bitmap file path then.
        if (!readNameItem(ar)) return false;
        std::string path;
        {
            auto label = QuickArchive::Scope::label(ar, "bumpTex");
            if (!ar.readWString(path)) return false;
        }
        bumpTex = makeBitmapTexture(path);
        ar.read(bumpTexMult);
        return readMember(ar, baseMtl, "baseMtl");
    }
    if (version == 2) {
        if (!ar.readWString(name)) return false;
        ar.read(bumpTexMult);
        return readOptionalMember(ar, bumpTex, "bumpTex") && readMember(ar, baseMtl, "baseMtl");
    }
    return record::readFields(ar, *this, fields(), version);
}

bool MaterialBump::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && kind::copyChildren(*this, kBumpParameters);
}

// --- MaterialDisplaced ---

std::span<const record::Field<MaterialDisplaced>> MaterialDisplaced::fields() { return kDisplacedFields; }

bool MaterialDisplaced::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && copyMember(displaceTex);
}

void MaterialDisplaced::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (walk && baseMtl) baseMtl->writeXml(writer, urlPrefix + "/" + name);
}

// --- MaterialOverrideEnvironment ---

std::span<const record::Field<MaterialOverrideEnvironment>> MaterialOverrideEnvironment::fields() {
    return kOverrideFields;
}

bool MaterialOverrideEnvironment::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && copyMember(giTex) && copyMember(bgTex) && copyMember(reflectTex) &&
           copyMember(refractTex);
}

void MaterialOverrideEnvironment::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (walk && baseMtl) baseMtl->writeXml(writer, urlPrefix + "/" + name);
}

// --- MaterialObjectExclusion ---

std::span<const record::Field<MaterialObjectExclusion>> MaterialObjectExclusion::fields() { return kExclusionFields; }
std::span<const kind::ParameterRow<MaterialObjectExclusion>> MaterialObjectExclusion::parameters() {
    return kExclusionParameters;
}

bool MaterialObjectExclusion::separate(bool renamed) { return copyMember(baseMtl, renamed); }

// --- MaterialAlphaContribution ---

std::span<const record::Field<MaterialAlphaContribution>> MaterialAlphaContribution::fields() {
    return kAlphaFields;
}
std::span<const kind::ParameterRow<MaterialAlphaContribution>> MaterialAlphaContribution::parameters() {
    return kAlphaParameters;
}

bool MaterialAlphaContribution::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && kind::copyChildren(*this, kAlphaParameters);
}

// --- MaterialToon ---

std::span<const record::Field<MaterialToon>> MaterialToon::fields() { return kToonFields; }
std::span<const kind::ParameterRow<MaterialToon>> MaterialToon::parameters() { return kToonParameters; }

bool MaterialToon::separate(bool) {
    return copyMember(baseMtl, true) && kind::copyChildren(*this, kToonParameters);
}

} // namespace OrvexKavorCore
