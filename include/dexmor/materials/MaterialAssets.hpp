#pragma once
// How a material becomes the XML assets of its "<Assets>" block.
//
// The renderer that reads the document knows few material plugins, so a material
// tree is folded: the bump, displacement, environment override, object exclusion
// and alpha contribution wrappers become parameters of one "MtlORVEX" asset built
// around the first layered material found below them, under the url "/" + the
// name of the material folded. Two-sided, host two-sided, angle-blend and toon
// materials keep an asset of their own (with a named layout) that refers to the
// folded assets of their sub-materials by url ("/" + the sub-material's name).
#include <dexmor/materials/BaseMaterial.hpp>

#include <cstdint>
#include <string>
#include <vector>

namespace OrvexKavorCore {

class AssetXmlWriter;

// Writes one complete "<Assets>" block for the material.
void writeMaterialAssets(AssetXmlWriter& writer, const MaterialPtr& material);

// The text of writeMaterialAssets for one material.
std::string materialToXml(const MaterialPtr& material);

// The folded asset of the material: nothing when it is absent or holds no layered
// material where the search looks.
void writeFoldedAsset(AssetXmlWriter& writer, const MaterialPtr& material);

// The materials of `kind` that the folding sees from `material`: the material
// itself when it is of that kind (the search does not look inside it); otherwise
// what the wrappers wrap, the front and back of two-sided kinds, both materials of
// an angle blend, the linked material of a link, and the library's target (or,
// when the library has none, the held material) of a reference. Layered, single,
// multi and instance materials are not looked into. A search that comes back to a
// material it is already inside contributes nothing there.
std::vector<MaterialPtr> findMaterialsOfKind(const MaterialPtr& material, std::int32_t kind);

// Whether a sub-material parameter refers to the material: false when absent, and
// for a reference material without a target identifier.
bool isReferenceable(const MaterialPtr& material);

} // namespace OrvexKavorCore
