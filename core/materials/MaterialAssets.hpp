#pragma once
// How a material becomes the XML assets of its "<Assets>" block.
#include "materials/BaseMaterial.hpp"

#include <string>

namespace OrvexKavorCore {

class AssetXmlWriter;

// Writes one complete "<Assets>" block for the material.
void writeMaterialAssets(AssetXmlWriter& writer, const MaterialPtr& material);

} // namespace OrvexKavorCore
