#pragma once
// The interface every class written to the XML document implements: its assets,
// and the plugin a "plugin" parameter refers to.
#include <string>

namespace OrvexKavorCore {
class AssetXmlWriter;
} // namespace OrvexKavorCore

struct OrvexXMLSerializable {
    virtual ~OrvexXMLSerializable() = default;
    // Writes the object's asset(s). `path` is the hierarchical asset name (UTF-8)
    // under which the object is written.
    virtual void writeXml(OrvexKavorCore::AssetXmlWriter& writer, std::string path) = 0;
    // The renderer plugin the object stands for ("BRDFDiffuse").
    virtual std::string pluginType() const = 0;
    // The family word of the object's asset ("material", "BRDF", "texture", ...).
    virtual std::string assetType() const = 0;
};
