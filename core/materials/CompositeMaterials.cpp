#include <dexmor/materials/CompositeMaterials.hpp>

#include <dexmor/xml/AssetXmlWriter.hpp>

#include <algorithm>
#include <array>

namespace OrvexKavorCore {

namespace {

using material::baseRecord;
using material::writeAssetOf;
using material::nameItem;
using material::Optional;
using record::between;
using record::field;
using record::fieldAs;
using record::since;

constexpr std::array kMultiFields = {
    fieldAs<material::List<MaterialPtr>, &MaterialMulti::subMaterials>("subMaterials"),
    nameItem<MaterialMulti>(between(1, 1)),
    baseRecord<MaterialMulti>(since(2)),
};

constexpr std::array k2SidedFields = {
    fieldAs<Optional<MaterialPtr>, &Material2Sided::front>("front"),
    fieldAs<Optional<MaterialPtr>, &Material2Sided::back>("back"),
    fieldAs<Optional<TexturePtr>, &Material2Sided::translucencyTex>("translucencyTex"),
    field<&Material2Sided::translucency>("translucency"),
    field<&Material2Sided::translucencyTexMult>("translucencyTexMult"),
    field<&Material2Sided::force1Sided>("force1Sided"),
    fieldAs<Optional<TexturePtr>, &Material2Sided::transparencyTex>("transparencyTex", since(2)),
    field<&Material2Sided::transparency>("transparency", since(2)),
    field<&Material2Sided::transparencyTexMult>("transparencyTexMult", since(2)),
    baseRecord<Material2Sided>(since(3)),
};

constexpr std::array kSkp2SidedFields = {
    baseRecord<MaterialSkp2Sided>(),
    fieldAs<Optional<MaterialPtr>, &MaterialSkp2Sided::front>("front"),
    fieldAs<Optional<MaterialPtr>, &MaterialSkp2Sided::back>("back"),
    field<&MaterialSkp2Sided::force1Sided>("force1Sided"),
};

constexpr std::array kAngleBlendFields = {
    baseRecord<MaterialAngleBlend>(),
    fieldAs<Optional<MaterialPtr>, &MaterialAngleBlend::mtlOne>("mtlOne"),
    fieldAs<Optional<MaterialPtr>, &MaterialAngleBlend::mtlTwo>("mtlTwo"),
    field<&MaterialAngleBlend::startAngle>("startAngle"),
    field<&MaterialAngleBlend::stopAngle>("stopAngle"),
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

bool Material2Sided::separate(bool renamed) {
    return material::copyMember(front, renamed) && material::copyMember(back, renamed);
}

void Material2Sided::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(front, out);
    material::take(back, out);
}

void Material2Sided::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    const std::string translucencyUrl = url + "/translucency_tex", transparencyUrl = url + "/transparency_tex";
    writeAssetOf(writer, front, url);
    writeAssetOf(writer, back, url);
    writeAssetOf(writer, translucencyTex, translucencyUrl);
    writeAssetOf(writer, transparencyTex, transparencyUrl);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writePluginByName("front", url, nameOf(front));
    writer.writePluginByName("back", url, nameOf(back));
    writer.writePlugin("translucency_tex", translucencyTex, translucencyUrl);
    writer.writePlugin("transparency_tex", transparencyTex, transparencyUrl);
    writer.writeColor("translucency", translucency);
    writer.writeColor("transparency", transparency);
    writer.writeFloat("translucency_tex_mult", translucencyTexMult);
    writer.writeFloat("transparency_tex_mult", transparencyTexMult);
    writer.writeBool("force_1sided", force1Sided);
    material::endAsset(writer);
}

// --- MaterialSkp2Sided ---

std::span<const record::Field<MaterialSkp2Sided>> MaterialSkp2Sided::fields() { return kSkp2SidedFields; }

bool MaterialSkp2Sided::separate(bool renamed) {
    return material::copyMember(front, renamed) && material::copyMember(back, renamed);
}

void MaterialSkp2Sided::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(front, out);
    material::take(back, out);
}

void MaterialSkp2Sided::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    writeAssetOf(writer, front, url);
    writeAssetOf(writer, back, url);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writePluginByName("front", url, nameOf(front));
    writer.writePluginByName("back", url, nameOf(back));
    writer.writeBool("force_1sided", force1Sided);
    material::endAsset(writer);
}

// --- MaterialAngleBlend ---

std::span<const record::Field<MaterialAngleBlend>> MaterialAngleBlend::fields() { return kAngleBlendFields; }

bool MaterialAngleBlend::separate(bool renamed) {
    return material::copyMember(mtlOne, renamed) && material::copyMember(mtlTwo, renamed);
}

void MaterialAngleBlend::takeMaterialMembers(std::vector<MaterialPtr>& out) {
    material::take(mtlOne, out);
    material::take(mtlTwo, out);
}

void MaterialAngleBlend::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    writeAssetOf(writer, mtlOne, url);
    writeAssetOf(writer, mtlTwo, url);
    material::beginAsset(writer, url, "", kInfo.pluginType);
    writer.writePluginByName("mtl_one", url, nameOf(mtlOne));
    writer.writePluginByName("mtl_two", url, nameOf(mtlTwo));
    writer.writeFloat("start_angle", startAngle);
    writer.writeFloat("stop_angle", stopAngle);
    material::endAsset(writer);
}

} // namespace OrvexKavorCore
