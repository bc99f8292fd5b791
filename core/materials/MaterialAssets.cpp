#include "materials/MaterialAssets.hpp"

#include "xml/AssetXmlWriter.hpp"

namespace OrvexKavorCore {

void writeMaterialAssets(AssetXmlWriter& writer, const MaterialPtr& /*material*/) {
    writer.beginDocument();
    writer.endDocument();
}

} // namespace OrvexKavorCore
