#include <dexmor/materials/LayeredMaterials.hpp>

#include <dexmor/xml/AssetXmlWriter.hpp>

#include <algorithm>
#include <array>

namespace OrvexKavorCore {

namespace {

using kind::baseRecord;
using material::nameItem;
using record::between;
using record::field;
using record::since;

constexpr std::array kLayeredFields = {
    replay::listRow<&MaterialLayeredBRDF::layers, &MaterialLayeredBRDF::replayedLayers>("layers"),
    field<&MaterialLayeredBRDF::doubleSided>("doubleSided"),
    field<&MaterialLayeredBRDF::option1>("option1"),
    field<&MaterialLayeredBRDF::option2>("option2", since(3)),
    field<&MaterialLayeredBRDF::option3>("option3", since(3)),
    nameItem<MaterialLayeredBRDF>(between(1, 1)),
    baseRecord<MaterialLayeredBRDF>(since(2)),
    field<&MaterialLayeredBRDF::option4>("option4", since(4)),
};

constexpr std::array kSingleFields = {
    field<&MaterialSingleBRDF::option1>("option1"),
    field<&MaterialSingleBRDF::option2>("option2"),
    nameItem<MaterialSingleBRDF>(between(1, 1)),
    record::fieldAs<material::Required<BRDFPtr>, &MaterialSingleBRDF::brdf>("brdf"),
    baseRecord<MaterialSingleBRDF>(since(2)),
};

} // namespace

// --- MaterialLayeredBRDF ---

std::span<const record::Field<MaterialLayeredBRDF>> MaterialLayeredBRDF::fields() { return kLayeredFields; }

bool MaterialLayeredBRDF::canBeWritten() const {
    return std::all_of(layers.begin(), layers.end(), [](const BRDFPtr& layer) { return static_cast<bool>(layer); });
}

bool MaterialLayeredBRDF::separate(bool) {
    for (BRDFPtr& layer : layers)
        if (!material::copyMember(layer)) return false;
    return true;
}

void MaterialLayeredBRDF::writeXml(AssetXmlWriter& writer, std::string urlPrefix) {
    MaterialWalk walk(MaterialWalk::kXml, this);
    if (!walk) return;
    const std::string url = urlPrefix + "/" + name;
    writeLayerAssets(writer, url);
    kind::beginAsset(writer, url, "material", kInfo.pluginType, kLayout);
    writeLayerParameters(writer, url);
    kind::endAsset(writer);
}

// Each layer in order: the held ones, or those read again (see ListReplay.hpp).
void MaterialLayeredBRDF::forEachLayer(const std::function<void(const BRDFPtr&)>& visit) const {
    for (const BRDFPtr& layer : layers)
        if (layer) visit(layer);
    replay::forEach<BRDFPtr>(replayedLayers, visit);
}

void MaterialLayeredBRDF::writeLayerAssets(AssetXmlWriter& writer, const std::string& url) const {
    forEachLayer([&](const BRDFPtr& layer) { layer->writeXml(writer, url); });
}

void MaterialLayeredBRDF::writeLayerParameters(AssetXmlWriter& writer, const std::string& url) const {
    writer.writeInteger("double_sided", doubleSided);
    writer.beginList("brdfs", "plugin");
    forEachLayer([&](const BRDFPtr& layer) { writer.writeEntry(url + "/" + layer->name); });
    writer.endList();
}

// --- MaterialSingleBRDF ---

std::span<const record::Field<MaterialSingleBRDF>> MaterialSingleBRDF::fields() { return kSingleFields; }

} // namespace OrvexKavorCore
