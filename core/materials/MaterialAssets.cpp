#include <dexmor/materials/MaterialAssets.hpp>

#include <dexmor/lights/SunLight.hpp>

#include <dexmor/materials/CompositeMaterials.hpp>
#include <dexmor/materials/LayeredMaterials.hpp>
#include <dexmor/materials/ReferenceMaterials.hpp>
#include <dexmor/materials/WrapperMaterials.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <initializer_list>

namespace OrvexKavorCore {

namespace {

// The material as `Kind` when its kind id says it is one; the id picks the one
// cast worth trying, so a search does not try every kind in turn.
template <class Kind>
const Kind* as(const BaseMaterial& m, std::int32_t kindId) {
    return kindId == Kind::kInfo.kind ? dynamic_cast<const Kind*>(&m) : nullptr;
}

// The materials the search looks through, in order.
std::vector<MaterialPtr> lookedThrough(const BaseMaterial& m) {
    const std::int32_t kind = m.kindId();
    if (const auto* bump = as<MaterialBump>(m, kind)) return {bump->baseMtl};
    if (const auto* env = as<MaterialOverrideEnvironment>(m, kind)) return {env->baseMtl};
    if (const auto* displaced = as<MaterialDisplaced>(m, kind)) return {displaced->baseMtl};
    if (const auto* exclusion = as<MaterialObjectExclusion>(m, kind)) return {exclusion->baseMtl};
    if (const auto* alpha = as<MaterialAlphaContribution>(m, kind)) return {alpha->baseMtl};
    if (const auto* toon = as<MaterialToon>(m, kind)) return {toon->baseMtl};
    if (const auto* linked = as<MaterialLinked>(m, kind)) return {linked->linkedMaterial};
    if (const auto* twoSided = as<Material2Sided>(m, kind)) return {twoSided->front, twoSided->back};
    if (const auto* host = as<MaterialSkp2Sided>(m, kind)) return {host->front, host->back};
    if (const auto* blend = as<MaterialAngleBlend>(m, kind)) return {blend->mtlOne, blend->mtlTwo};
    if (const auto* reference = as<MaterialReference>(m, kind)) return {reference->resolve()};
    return {}; // layered, single, multi, instance
}

void search(const MaterialPtr& material, std::int32_t kind, std::vector<MaterialPtr>& found) {
    if (!material) return;
    if (material->kindId() == kind) {
        found.push_back(material);
        return;
    }
    MaterialWalk walk(MaterialWalk::kSearch, material.get());
    if (!walk) return;
    for (const MaterialPtr& inner : lookedThrough(*material)) search(inner, kind, found);
}

// The first material of the kind below `material`, as its class; none when the
// material of that kind id is not of the class.
template <class Kind>
boost::shared_ptr<Kind> firstOf(const MaterialPtr& material) {
    const std::vector<MaterialPtr> found = findMaterialsOfKind(material, Kind::kInfo.kind);
    return found.empty() ? boost::shared_ptr<Kind>() : boost::dynamic_pointer_cast<Kind>(found.front());
}

using kind::flag;
using kind::reference;
using kind::value;

// A sub-material parameter: "/" + its name, written only for a referenceable one.
template <auto M>
constexpr kind::ParameterRow<kind::ClassOf<M>> referenceByName(const char* name) {
    using Obj = kind::ClassOf<M>;
    return {name, nullptr, nullptr, nullptr, [](AssetXmlWriter& w, const char* n, const Obj& o, const std::string&) {
                if (isReferenceable(o.*M)) w.writePluginByName(n, {}, nameOf(o.*M));
            }};
}

// The "bool" parameter `name`, true: the folded wrapper is there.
template <class Obj>
constexpr kind::ParameterRow<Obj> switchedOn(const char* name) {
    return {name, nullptr, nullptr, nullptr,
            [](AssetXmlWriter& w, const char* n, const Obj&, const std::string&) { w.writeBool(n, true); }};
}

// --- the parameters each wrapper adds to the folded asset ---

constexpr std::array kBumpFolded = {
    switchedOn<MaterialBump>("bump_on"),
    value<&MaterialBump::bumpTexMult>("bump_tex_mult"),
    reference<&MaterialBump::bumpTex>("bump_tex", "bump_tex"),
};

constexpr std::array kDisplacedFolded = {
    switchedOn<MaterialDisplaced>("displace_on"),
    value<&MaterialDisplaced::displaceShift>("displace_shift"),
    value<&MaterialDisplaced::displaceEdgeLength>("displace_edge_length"),
    value<&MaterialDisplaced::displaceTexMult>("displace_tex_mult"),
    value<&MaterialDisplaced::displaceMaxSubdivs>("displace_max_subdivs"),
    value<&MaterialDisplaced::displaceContinuity>("displace_continuity"),
    value<&MaterialDisplaced::displaceViewDependent>("displace_view_dependent"),
    value<&MaterialDisplaced::displaceUseGlobals>("displace_use_globals"),
    reference<&MaterialDisplaced::displaceTex>("displace_tex", "displace_tex"),
};

constexpr std::array kEnvironmentFolded = {
    reference<&MaterialOverrideEnvironment::giTex>("gi_tex", "gi_tex"),
    reference<&MaterialOverrideEnvironment::bgTex>("bg_tex", "bg_tex"),
    reference<&MaterialOverrideEnvironment::reflectTex>("reflect_tex", "reflect_tex"),
    reference<&MaterialOverrideEnvironment::refractTex>("refract_tex", "refract_tex"),
    value<&MaterialOverrideEnvironment::giColor>("gi_color"),
    value<&MaterialOverrideEnvironment::bgColor>("bg_color"),
    value<&MaterialOverrideEnvironment::reflectColor>("reflect_color"),
    value<&MaterialOverrideEnvironment::refractColor>("refract_color"),
    value<&MaterialOverrideEnvironment::bgTexMult>("bg_tex_mult"),
    value<&MaterialOverrideEnvironment::giTexMult>("gi_tex_mult"),
    value<&MaterialOverrideEnvironment::reflectTexMult>("reflect_tex_mult"),
    value<&MaterialOverrideEnvironment::refractTexMult>("refract_tex_mult"),
    value<&MaterialOverrideEnvironment::overrideBg>("override_bg"),
    value<&MaterialOverrideEnvironment::overrideGi>("override_gi"),
    value<&MaterialOverrideEnvironment::overrideReflect>("override_reflect"),
    value<&MaterialOverrideEnvironment::overrideRefract>("override_refract"),
};

constexpr std::array kExclusionFolded = {
    flag<&MaterialObjectExclusion::mode>("ignore_objects"),
    value<&MaterialObjectExclusion::shortCircuit>("short_circuit"),
};

constexpr std::array kAlphaFolded = {
    value<&MaterialAlphaContribution::alpha>("alpha"),
    value<&MaterialAlphaContribution::alphaTexMult>("alpha_tex_mult"),
    reference<&MaterialAlphaContribution::alphaTex>("alpha_tex", "alpha_tex"),
};

// --- the own assets of the kinds that keep one ---

constexpr std::array kAngleBlendAsset = {
    referenceByName<&MaterialAngleBlend::mtlOne>("mtl_one"),
    referenceByName<&MaterialAngleBlend::mtlTwo>("mtl_two"),
    value<&MaterialAngleBlend::startAngle>("start_angle"),
    value<&MaterialAngleBlend::stopAngle>("stop_angle"),
};

constexpr std::array k2SidedAsset = {
    referenceByName<&Material2Sided::front>("front"),
    referenceByName<&Material2Sided::back>("back"),
    value<&Material2Sided::translucency>("translucency"),
    value<&Material2Sided::force1Sided>("force_1sided"),
};

constexpr std::array kSkp2SidedAsset = {
    referenceByName<&MaterialSkp2Sided::front>("front"),
    referenceByName<&MaterialSkp2Sided::back>("back"),
    value<&MaterialSkp2Sided::force1Sided>("force_1sided"),
};

constexpr std::array kToonAsset = {
    referenceByName<&MaterialToon::baseMtl>("base_mtl"),
    reference<&MaterialToon::lineColorTex>("lineColorTex", "color_tex"),
    reference<&MaterialToon::distortTex>("distortTex", "distort_tex"),
    reference<&MaterialToon::opacityTex>("opacityTex", "opacity_tex"),
    reference<&MaterialToon::lineWidthTex>("lineWidthTex", "width_tex"),
    value<&MaterialToon::lineColor>("lineColor"),
    value<&MaterialToon::lineColorTexMult>("lineColorTexMult"),
    value<&MaterialToon::distort>("distort"),
    value<&MaterialToon::distortTexMult>("distortTexMult"),
    value<&MaterialToon::opacity>("opacity"),
    value<&MaterialToon::opacityTexMult>("opacityTexMult"),
    value<&MaterialToon::lineWidth>("lineWidth"),
    value<&MaterialToon::lineWidthTexMult>("lineWidthTexMult"),
    value<&MaterialToon::zThreshold>("zThreshold"),
    value<&MaterialToon::traceBias>("traceBias"),
    value<&MaterialToon::normalThreshold>("normalThreshold"),
    value<&MaterialToon::silhouetteMult>("silhouetteMult"),
    value<&MaterialToon::doSecondary>("doSecondary"),
    value<&MaterialToon::divideByDist>("divideByDist"),
    value<&MaterialToon::doSilhouetteMult>("doSilhouetteMult"),
};

// The assets of the textures the rows refer to, then the material's own asset
// under "/" + its name, with `layout`.
template <class Kind, class Rows>
void writeOwnAsset(AssetXmlWriter& writer, const Kind& m, const char* layout, const Rows& rows) {
    const std::string url = "/" + m.name;
    kind::writeChildAssets(writer, m, url, rows);
    kind::beginAsset(writer, url, "material", m.pluginType(), layout);
    kind::writeParameters(writer, m, url, rows);
    kind::endAsset(writer);
}

// A folded wrapper's texture assets / parameters, when the wrapper is there.
template <class Kind, class Rows>
void writeFoldedChildren(AssetXmlWriter& writer, const boost::shared_ptr<Kind>& m, const std::string& url,
                         const Rows& rows) {
    if (m) kind::writeChildAssets(writer, *m, url, rows);
}
template <class Kind, class Rows>
void writeFoldedParameters(AssetXmlWriter& writer, const boost::shared_ptr<Kind>& m, const std::string& url,
                           const Rows& rows) {
    if (m) kind::writeParameters(writer, *m, url, rows);
}

} // namespace

std::vector<MaterialPtr> findMaterialsOfKind(const MaterialPtr& material, std::int32_t kind) {
    std::vector<MaterialPtr> found;
    search(material, kind, found);
    return found;
}

bool isReferenceable(const MaterialPtr& material) {
    if (!material) return false;
    if (const auto* reference = dynamic_cast<const MaterialReference*>(material.get()))
        return !reference->targetId.empty();
    return true;
}

void writeFoldedAsset(AssetXmlWriter& writer, const MaterialPtr& material) {
    if (!material) return;
    const auto layered = firstOf<MaterialLayeredBRDF>(material);
    if (!layered) return;
    const auto bump = firstOf<MaterialBump>(material);
    const auto displaced = firstOf<MaterialDisplaced>(material);
    const auto environment = firstOf<MaterialOverrideEnvironment>(material);
    const auto exclusion = firstOf<MaterialObjectExclusion>(material);
    const auto alpha = firstOf<MaterialAlphaContribution>(material);

    const std::string url = "/" + material->name;
    // The textures' assets, the layers' assets, then the folded asset.
    writeFoldedChildren(writer, bump, url, kBumpFolded);
    writeFoldedChildren(writer, displaced, url, kDisplacedFolded);
    writeFoldedChildren(writer, environment, url, kEnvironmentFolded);
    writeFoldedChildren(writer, alpha, url, kAlphaFolded);
    layered->writeLayerAssets(writer, url);

    kind::beginAsset(writer, url, "material", layered->pluginType(), MaterialLayeredBRDF::kLayout);
    layered->writeLayerParameters(writer, url);
    writeFoldedParameters(writer, bump, url, kBumpFolded);
    writeFoldedParameters(writer, displaced, url, kDisplacedFolded);
    writeFoldedParameters(writer, environment, url, kEnvironmentFolded);
    writeFoldedParameters(writer, exclusion, url, kExclusionFolded);
    writeFoldedParameters(writer, alpha, url, kAlphaFolded);
    kind::endAsset(writer);
}

void writeMaterialAssets(AssetXmlWriter& writer, const MaterialPtr& material) {
    writer.beginDocument();
    if (const auto* blend = dynamic_cast<const MaterialAngleBlend*>(material.get())) {
        writeFoldedAsset(writer, blend->mtlOne);
        writeFoldedAsset(writer, blend->mtlTwo);
        writeOwnAsset(writer, *blend, "AngleBlendMatLayout", kAngleBlendAsset);
    } else if (const auto* twoSided = dynamic_cast<const Material2Sided*>(material.get())) {
        writeFoldedAsset(writer, twoSided->front);
        writeFoldedAsset(writer, twoSided->back);
        writeOwnAsset(writer, *twoSided, "TwoSidedMatLayout", k2SidedAsset);
    } else if (const auto* host = dynamic_cast<const MaterialSkp2Sided*>(material.get())) {
        writeFoldedAsset(writer, host->front);
        writeFoldedAsset(writer, host->back);
        writeOwnAsset(writer, *host, "SkpTwoSidedMatLayout", kSkp2SidedAsset);
    } else if (const auto* toon = dynamic_cast<const MaterialToon*>(material.get())) {
        writeFoldedAsset(writer, toon->baseMtl);
        writeOwnAsset(writer, *toon, "ToonMatLayout", kToonAsset);
    } else {
        writeFoldedAsset(writer, material);
    }
    writer.endDocument();
}

std::string materialToXml(const MaterialPtr& material) {
    // A document of its own: its sun assets are written anew.
    DocumentSunUrls suns;
    PerConversion<DocumentSunUrls>::Use document(suns);
    std::string xml;
    AssetXmlWriter writer(xml);
    writeMaterialAssets(writer, material);
    return xml;
}

} // namespace OrvexKavorCore
