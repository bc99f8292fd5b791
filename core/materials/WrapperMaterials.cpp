#include <dexmor/materials/WrapperMaterials.hpp>

#include <dexmor/textures/TextureFunctions.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using material::baseRecord;
using material::copyMember;
using material::writeAssetOf;
using material::Optional;
using material::Required;
using record::field;
using record::fieldAs;
using record::since;

template <auto M>
constexpr auto optionalMaterial(const char* name) {
    return fieldAs<Optional<MaterialPtr>, M>(name);
}
template <auto M>
constexpr auto optionalTexture(const char* name) {
    return fieldAs<Optional<TexturePtr>, M>(name);
}

// --- bump: the current record (older ones are read by hand) ---

constexpr std::array kBumpFields = {
    field<&MaterialBump::bumpTexMult>("bumpTexMult"),
    optionalTexture<&MaterialBump::bumpTex>("bumpTex"),
    fieldAs<Required<MaterialPtr>, &MaterialBump::baseMtl>("baseMtl"),
    baseRecord<MaterialBump>(),
};

constexpr std::array kDisplacedFields = {
    baseRecord<MaterialDisplaced>(),
    optionalMaterial<&MaterialDisplaced::baseMtl>("baseMtl"),
    optionalTexture<&MaterialDisplaced::displaceTex>("displaceTex"),
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
    optionalMaterial<&MaterialOverrideEnvironment::baseMtl>("baseMtl"),
    optionalTexture<&MaterialOverrideEnvironment::bgTex>("bgTex"),
    optionalTexture<&MaterialOverrideEnvironment::giTex>("giTex"),
    optionalTexture<&MaterialOverrideEnvironment::reflectTex>("reflectTex"),
    optionalTexture<&MaterialOverrideEnvironment::refractTex>("refractTex"),
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
    optionalMaterial<&MaterialObjectExclusion::baseMtl>("baseMtl"),
    fieldAs<material::TextList, &MaterialObjectExclusion::objects>("objects"),
    baseRecord<MaterialObjectExclusion>(since(2)),
    field<&MaterialObjectExclusion::shortCircuit>("shortCircuit", since(3)),
};

constexpr std::array kAlphaFields = {
    baseRecord<MaterialAlphaContribution>(),
    optionalMaterial<&MaterialAlphaContribution::baseMtl>("baseMtl"),
    optionalTexture<&MaterialAlphaContribution::alphaTex>("alphaTex"),
    field<&MaterialAlphaContribution::alphaTexMult>("alphaTexMult"),
    field<&MaterialAlphaContribution::alpha>("alpha"),
};

constexpr std::array kToonFields = {
    optionalMaterial<&MaterialToon::baseMtl>("baseMtl"),
    field<&MaterialToon::lineWidth>("lineWidth"),
    field<&MaterialToon::lineWidthTexMult>("lineWidthTexMult"),
    optionalTexture<&MaterialToon::lineWidthTex>("lineWidthTex"),
    field<&MaterialToon::opacity>("opacity"),
    field<&MaterialToon::opacityTexMult>("opacityTexMult"),
    optionalTexture<&MaterialToon::opacityTex>("opacityTex"),
    field<&MaterialToon::distort>("distort"),
    field<&MaterialToon::distortTexMult>("distortTexMult"),
    optionalTexture<&MaterialToon::distortTex>("distortTex"),
    field<&MaterialToon::lineColor>("lineColor"),
    field<&MaterialToon::lineColorTexMult>("lineColorTexMult"),
    optionalTexture<&MaterialToon::lineColorTex>("lineColorTex"),
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


} // namespace

// --- MaterialBump ---

std::span<const record::Field<MaterialBump>> MaterialBump::fields() { return kBumpFields; }

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
    return copyMember(baseMtl, renamed) && copyMember(bumpTex);
}

void MaterialBump::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    const std::string bumpUrl = url + "/bump_tex";
    writeAssetOf(writer, baseMtl, url);
    writeAssetOf(writer, bumpTex, bumpUrl);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writeFloat("bump_tex_mult", bumpTexMult);
    writer.writePluginByName("base_mtl", url, nameOf(baseMtl));
    writer.writePlugin("bump_tex", bumpTex, bumpUrl);
    material::endAsset(writer);
}

// --- MaterialDisplaced ---

std::span<const record::Field<MaterialDisplaced>> MaterialDisplaced::fields() { return kDisplacedFields; }

bool MaterialDisplaced::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && copyMember(displaceTex);
}

void MaterialDisplaced::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (walk) writeAssetOf(writer, baseMtl, urlPrefix + "/" + name);
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
    if (walk) writeAssetOf(writer, baseMtl, urlPrefix + "/" + name);
}

// --- MaterialObjectExclusion ---

std::span<const record::Field<MaterialObjectExclusion>> MaterialObjectExclusion::fields() { return kExclusionFields; }

bool MaterialObjectExclusion::separate(bool renamed) { return copyMember(baseMtl, renamed); }

void MaterialObjectExclusion::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    writeAssetOf(writer, baseMtl, url);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writePluginByName("base_mtl", url, nameOf(baseMtl));
    writer.writeInteger("mode", mode);
    writer.writeBool("short_circuit", shortCircuit);
    writer.beginList("objects", "string");
    for (const std::string& object : objects) writer.writeStringEntry(object);
    writer.endList();
    material::endAsset(writer);
}

// --- MaterialAlphaContribution ---

std::span<const record::Field<MaterialAlphaContribution>> MaterialAlphaContribution::fields() {
    return kAlphaFields;
}

bool MaterialAlphaContribution::separate(bool renamed) {
    return copyMember(baseMtl, renamed) && copyMember(alphaTex);
}

void MaterialAlphaContribution::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    const std::string alphaUrl = url + "/alpha_tex";
    writeAssetOf(writer, baseMtl, url);
    writeAssetOf(writer, alphaTex, alphaUrl);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writeFloat("alpha", alpha);
    writer.writeFloat("alpha_tex_mult", alphaTexMult);
    writer.writePluginByName("base_mtl", url, nameOf(baseMtl));
    writer.writePlugin("alpha_tex", alphaTex, alphaUrl);
    material::endAsset(writer);
}

// --- MaterialToon ---

std::span<const record::Field<MaterialToon>> MaterialToon::fields() { return kToonFields; }

bool MaterialToon::separate(bool) {
    return copyMember(baseMtl, true) && copyMember(lineColorTex) && copyMember(distortTex) &&
           copyMember(opacityTex) && copyMember(lineWidthTex);
}

void MaterialToon::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    const std::string colorUrl = url + "/color_tex", distortUrl = url + "/distort_tex",
                      opacityUrl = url + "/opacity_tex", widthUrl = url + "/width_tex";
    writeAssetOf(writer, baseMtl, url);
    writeAssetOf(writer, lineColorTex, colorUrl);
    writeAssetOf(writer, distortTex, distortUrl);
    writeAssetOf(writer, opacityTex, opacityUrl);
    writeAssetOf(writer, lineWidthTex, widthUrl);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writePluginByName("base_mtl", url, nameOf(baseMtl));
    writer.writePlugin("color_tex", lineColorTex, colorUrl);
    writer.writePlugin("distort_tex", distortTex, distortUrl);
    writer.writePlugin("opacity_tex", opacityTex, opacityUrl);
    writer.writePlugin("width_tex", lineWidthTex, widthUrl);
    writer.writeColor("color", lineColor);
    writer.writeFloat("color_tex_mult", lineColorTexMult);
    writer.writeFloat("distort", distort);
    writer.writeFloat("distort_tex_mult", distortTexMult);
    writer.writeFloat("opacity", opacity);
    writer.writeFloat("opacity_tex_mult", opacityTexMult);
    writer.writeFloat("width", lineWidth);
    writer.writeFloat("width_tex_mult", lineWidthTexMult);
    writer.writeFloat("z_threshold", zThreshold);
    writer.writeFloat("trace_bias", traceBias);
    writer.writeFloat("normal_threshold", normalThreshold);
    writer.writeFloat("line_units", lineUnits);
    writer.writeFloat("silhouette_mult", silhouetteMult);
    writer.writeBool("do_secondary", doSecondary);
    writer.writeBool("divide_by_distance", divideByDist);
    writer.writeBool("do_silhouette_mult", doSilhouetteMult);
    material::endAsset(writer);
}

} // namespace OrvexKavorCore
