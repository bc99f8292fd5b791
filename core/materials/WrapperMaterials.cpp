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
    field<&MaterialBump::bumpTexMult>("bump_tex_mult"),
    field<&MaterialBump::bumpTex>("bump_tex"),
    record::fieldAs<material::Required<MaterialPtr>, &MaterialBump::baseMtl>("base_mtl"),
    baseRecord<MaterialBump>(),
};

constexpr std::array kBumpParameters = {
    value<&MaterialBump::bumpTexMult>("bump_tex_mult"),
    subMaterial<&MaterialBump::baseMtl>("base_mtl"),
    reference<&MaterialBump::bumpTex>("bump_tex", "bump_tex"),
};

constexpr std::array kDisplacedFields = {
    baseRecord<MaterialDisplaced>(),
    field<&MaterialDisplaced::baseMtl>("base_mtl"),
    field<&MaterialDisplaced::displaceTex>("displace_tex"),
    field<&MaterialDisplaced::displaceTexMult>("displace_tex_mult"),
    field<&MaterialDisplaced::displaceShift>("displace_shift", since(2)),
    field<&MaterialDisplaced::displaceEdgeLength>("displace_edge_length", since(2)),
    field<&MaterialDisplaced::displaceMaxSubdivs>("displace_max_subdivs", since(2)),
    field<&MaterialDisplaced::displaceContinuity>("displace_continuity", since(2)),
    field<&MaterialDisplaced::displaceViewDependent>("displace_view_dependent", since(2)),
    field<&MaterialDisplaced::displaceUseGlobals>("displace_use_globals", since(2)),
};

constexpr std::array kOverrideFields = {
    baseRecord<MaterialOverrideEnvironment>(),
    field<&MaterialOverrideEnvironment::baseMtl>("base_mtl"),
    field<&MaterialOverrideEnvironment::bgTex>("bg_tex"),
    field<&MaterialOverrideEnvironment::giTex>("gi_tex"),
    field<&MaterialOverrideEnvironment::reflectTex>("reflect_tex"),
    field<&MaterialOverrideEnvironment::refractTex>("refract_tex"),
    field<&MaterialOverrideEnvironment::bgColor>("bg_color"),
    field<&MaterialOverrideEnvironment::giColor>("gi_color"),
    field<&MaterialOverrideEnvironment::reflectColor>("reflect_color"),
    field<&MaterialOverrideEnvironment::refractColor>("refract_color"),
    field<&MaterialOverrideEnvironment::bgTexMult>("bg_tex_mult"),
    field<&MaterialOverrideEnvironment::giTexMult>("gi_tex_mult"),
    field<&MaterialOverrideEnvironment::reflectTexMult>("reflect_tex_mult"),
    field<&MaterialOverrideEnvironment::refractTexMult>("refract_tex_mult"),
    field<&MaterialOverrideEnvironment::overrideBg>("override_bg"),
    field<&MaterialOverrideEnvironment::overrideGi>("override_gi"),
    field<&MaterialOverrideEnvironment::overrideReflect>("override_reflect"),
    field<&MaterialOverrideEnvironment::overrideRefract>("override_refract"),
};

constexpr std::array kExclusionFields = {
    field<&MaterialObjectExclusion::mode>("mode"),
    field<&MaterialObjectExclusion::baseMtl>("base_mtl"),
    field<&MaterialObjectExclusion::objects>("objects"),
    baseRecord<MaterialObjectExclusion>(since(2)),
    field<&MaterialObjectExclusion::shortCircuit>("short_circuit", since(3)),
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
    field<&MaterialAlphaContribution::baseMtl>("base_mtl"),
    field<&MaterialAlphaContribution::alphaTex>("alpha_tex"),
    field<&MaterialAlphaContribution::alphaTexMult>("alpha_tex_mult"),
    field<&MaterialAlphaContribution::alpha>("alpha"),
};

constexpr std::array kAlphaParameters = {
    value<&MaterialAlphaContribution::alpha>("alpha"),
    value<&MaterialAlphaContribution::alphaTexMult>("alpha_tex_mult"),
    subMaterial<&MaterialAlphaContribution::baseMtl>("base_mtl"),
    reference<&MaterialAlphaContribution::alphaTex>("alpha_tex", "alpha_tex"),
};

constexpr std::array kToonFields = {
    field<&MaterialToon::baseMtl>("base_mtl"),
    field<&MaterialToon::lineWidth>("width"),
    field<&MaterialToon::lineWidthTexMult>("width_tex_mult"),
    field<&MaterialToon::lineWidthTex>("width_tex"),
    field<&MaterialToon::opacity>("opacity"),
    field<&MaterialToon::opacityTexMult>("opacity_tex_mult"),
    field<&MaterialToon::opacityTex>("opacity_tex"),
    field<&MaterialToon::distort>("distort"),
    field<&MaterialToon::distortTexMult>("distort_tex_mult"),
    field<&MaterialToon::distortTex>("distort_tex"),
    field<&MaterialToon::lineColor>("color"),
    field<&MaterialToon::lineColorTexMult>("color_tex_mult"),
    field<&MaterialToon::lineColorTex>("color_tex"),
    field<&MaterialToon::zThreshold>("z_threshold"),
    field<&MaterialToon::traceBias>("trace_bias"),
    field<&MaterialToon::normalThreshold>("normal_threshold"),
    field<&MaterialToon::lineUnits>("line_units"),
    field<&MaterialToon::doSecondary>("do_secondary"),
    field<&MaterialToon::divideByDist>("divide_by_distance"),
    baseRecord<MaterialToon>(),
    field<&MaterialToon::doSilhouetteMult>("do_silhouette_mult", since(2)),
    field<&MaterialToon::silhouetteMult>("silhouette_mult", since(2)),
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
            auto label = QuickArchive::Scope::label(ar, "bump_tex");
            if (!ar.readWString(path)) return false;
        }
        bumpTex = makeBitmapTexture(path);
        ar.readAs("bump_tex_mult", bumpTexMult);
        return readMember(ar, baseMtl, "base_mtl");
    }
    if (version == 2) {
        if (!ar.readWStringAs("name", name)) return false;
        ar.readAs("bump_tex_mult", bumpTexMult);
        return readOptionalMember(ar, bumpTex, "bump_tex") && readMember(ar, baseMtl, "base_mtl");
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
