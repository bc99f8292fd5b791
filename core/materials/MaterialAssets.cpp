#include <dexmor/materials/MaterialAssets.hpp>

#include <dexmor/lights/SunLight.hpp>

#include <dexmor/materials/CompositeMaterials.hpp>
#include <dexmor/materials/LayeredMaterials.hpp>
#include <dexmor/materials/ReferenceMaterials.hpp>
#include <dexmor/materials/WrapperMaterials.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

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

// A sub-material parameter: "/" + its name, written only for a referenceable one.
void writeMaterialReference(AssetXmlWriter& writer, const char* name, const MaterialPtr& material) {
    if (isReferenceable(material)) writer.writePluginByName(name, {}, nameOf(material));
}

void writeAngleBlendAsset(AssetXmlWriter& writer, const MaterialAngleBlend& blend) {
    material::beginAsset(writer, "/" + blend.name, "AngleBlendMatLayout", blend.pluginType());
    writeMaterialReference(writer, "mtl_one", blend.mtlOne);
    writeMaterialReference(writer, "mtl_two", blend.mtlTwo);
    writer.writeFloat("start_angle", blend.startAngle);
    writer.writeFloat("stop_angle", blend.stopAngle);
    material::endAsset(writer);
}

void write2SidedAsset(AssetXmlWriter& writer, const Material2Sided& twoSided) {
    material::beginAsset(writer, "/" + twoSided.name, "TwoSidedMatLayout", twoSided.pluginType());
    writeMaterialReference(writer, "front", twoSided.front);
    writeMaterialReference(writer, "back", twoSided.back);
    writer.writeColor("translucency", twoSided.translucency);
    writer.writeBool("force_1sided", twoSided.force1Sided);
    material::endAsset(writer);
}

void writeSkp2SidedAsset(AssetXmlWriter& writer, const MaterialSkp2Sided& host) {
    material::beginAsset(writer, "/" + host.name, "SkpTwoSidedMatLayout", host.pluginType());
    writeMaterialReference(writer, "front", host.front);
    writeMaterialReference(writer, "back", host.back);
    writer.writeBool("force_1sided", host.force1Sided);
    material::endAsset(writer);
}

// The toon's textures, then its own asset.
void writeToonAssets(AssetXmlWriter& writer, const MaterialToon& toon) {
    const std::string url = "/" + toon.name;
    const std::string colorUrl = url + "/color_tex", distortUrl = url + "/distort_tex",
                      opacityUrl = url + "/opacity_tex", widthUrl = url + "/width_tex";
    material::writeAssetOf(writer, toon.lineColorTex, colorUrl);
    material::writeAssetOf(writer, toon.distortTex, distortUrl);
    material::writeAssetOf(writer, toon.opacityTex, opacityUrl);
    material::writeAssetOf(writer, toon.lineWidthTex, widthUrl);

    material::beginAsset(writer, url, "ToonMatLayout", toon.pluginType());
    writeMaterialReference(writer, "base_mtl", toon.baseMtl);
    writer.writePlugin("lineColorTex", toon.lineColorTex, colorUrl);
    writer.writePlugin("distortTex", toon.distortTex, distortUrl);
    writer.writePlugin("opacityTex", toon.opacityTex, opacityUrl);
    writer.writePlugin("lineWidthTex", toon.lineWidthTex, widthUrl);
    writer.writeColor("lineColor", toon.lineColor);
    writer.writeFloat("lineColorTexMult", toon.lineColorTexMult);
    writer.writeFloat("distort", toon.distort);
    writer.writeFloat("distortTexMult", toon.distortTexMult);
    writer.writeFloat("opacity", toon.opacity);
    writer.writeFloat("opacityTexMult", toon.opacityTexMult);
    writer.writeFloat("lineWidth", toon.lineWidth);
    writer.writeFloat("lineWidthTexMult", toon.lineWidthTexMult);
    writer.writeFloat("zThreshold", toon.zThreshold);
    writer.writeFloat("traceBias", toon.traceBias);
    writer.writeFloat("normalThreshold", toon.normalThreshold);
    writer.writeFloat("silhouetteMult", toon.silhouetteMult);
    writer.writeBool("doSecondary", toon.doSecondary);
    writer.writeBool("divideByDist", toon.divideByDist);
    writer.writeBool("doSilhouetteMult", toon.doSilhouetteMult);
    material::endAsset(writer);
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
    const std::string bumpUrl = url + "/bump_tex", displaceUrl = url + "/displace_tex", giUrl = url + "/gi_tex",
                      bgUrl = url + "/bg_tex", reflectUrl = url + "/reflect_tex", refractUrl = url + "/refract_tex",
                      alphaUrl = url + "/alpha_tex";

    // The textures' assets, the layers' assets, then the folded asset.
    if (bump) material::writeAssetOf(writer, bump->bumpTex, bumpUrl);
    if (displaced) material::writeAssetOf(writer, displaced->displaceTex, displaceUrl);
    if (environment) {
        material::writeAssetOf(writer, environment->giTex, giUrl);
        material::writeAssetOf(writer, environment->bgTex, bgUrl);
        material::writeAssetOf(writer, environment->reflectTex, reflectUrl);
        material::writeAssetOf(writer, environment->refractTex, refractUrl);
    }
    if (alpha) material::writeAssetOf(writer, alpha->alphaTex, alphaUrl);
    layered->writeLayerAssets(writer, url);

    material::beginAsset(writer, url, MaterialLayeredBRDF::kLayout, layered->pluginType());
    layered->writeLayerParameters(writer, url);
    if (bump) {
        writer.writeBool("bump_on", true);
        writer.writeFloat("bump_tex_mult", bump->bumpTexMult);
        writer.writePlugin("bump_tex", bump->bumpTex, bumpUrl);
    }
    if (displaced) {
        writer.writeBool("displace_on", true);
        writer.writeFloat("displace_shift", displaced->displaceShift);
        writer.writeFloat("displace_edge_length", displaced->displaceEdgeLength);
        writer.writeFloat("displace_tex_mult", displaced->displaceTexMult);
        writer.writeInteger("displace_max_subdivs", displaced->displaceMaxSubdivs);
        writer.writeInteger("displace_continuity", displaced->displaceContinuity);
        writer.writeInteger("displace_view_dependent", displaced->displaceViewDependent);
        writer.writeInteger("displace_use_globals", displaced->displaceUseGlobals);
        writer.writePlugin("displace_tex", displaced->displaceTex, displaceUrl);
    }
    if (environment) {
        writer.writePlugin("gi_tex", environment->giTex, giUrl);
        writer.writePlugin("bg_tex", environment->bgTex, bgUrl);
        writer.writePlugin("reflect_tex", environment->reflectTex, reflectUrl);
        writer.writePlugin("refract_tex", environment->refractTex, refractUrl);
        writer.writeColor("gi_color", environment->giColor);
        writer.writeColor("bg_color", environment->bgColor);
        writer.writeColor("reflect_color", environment->reflectColor);
        writer.writeColor("refract_color", environment->refractColor);
        writer.writeFloat("bg_tex_mult", environment->bgTexMult);
        writer.writeFloat("gi_tex_mult", environment->giTexMult);
        writer.writeFloat("reflect_tex_mult", environment->reflectTexMult);
        writer.writeFloat("refract_tex_mult", environment->refractTexMult);
        writer.writeBool("override_bg", environment->overrideBg);
        writer.writeBool("override_gi", environment->overrideGi);
        writer.writeBool("override_reflect", environment->overrideReflect);
        writer.writeBool("override_refract", environment->overrideRefract);
    }
    if (exclusion) {
        writer.writeBool("ignore_objects", exclusion->mode != 0);
        writer.writeBool("short_circuit", exclusion->shortCircuit);
    }
    if (alpha) {
        writer.writeFloat("alpha", alpha->alpha);
        writer.writeFloat("alpha_tex_mult", alpha->alphaTexMult);
        writer.writePlugin("alpha_tex", alpha->alphaTex, alphaUrl);
    }
    material::endAsset(writer);
}

void writeMaterialAssets(AssetXmlWriter& writer, const MaterialPtr& material) {
    writer.beginDocument();
    if (const auto* blend = dynamic_cast<const MaterialAngleBlend*>(material.get())) {
        writeFoldedAsset(writer, blend->mtlOne);
        writeFoldedAsset(writer, blend->mtlTwo);
        writeAngleBlendAsset(writer, *blend);
    } else if (const auto* twoSided = dynamic_cast<const Material2Sided*>(material.get())) {
        writeFoldedAsset(writer, twoSided->front);
        writeFoldedAsset(writer, twoSided->back);
        write2SidedAsset(writer, *twoSided);
    } else if (const auto* host = dynamic_cast<const MaterialSkp2Sided*>(material.get())) {
        writeFoldedAsset(writer, host->front);
        writeFoldedAsset(writer, host->back);
        writeSkp2SidedAsset(writer, *host);
    } else if (const auto* toon = dynamic_cast<const MaterialToon*>(material.get())) {
        writeFoldedAsset(writer, toon->baseMtl);
        writeToonAssets(writer, *toon);
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
