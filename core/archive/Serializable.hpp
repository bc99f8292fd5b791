#pragma once
// The two interfaces every stored class implements: moving itself through a
// QuickArchive, and writing itself as assets of the XML document.
#include <string>

namespace OrvexKavorCore {

class QuickArchive;
class AssetXmlWriter;

class OrvexSerializable {
public:
    virtual ~OrvexSerializable() = default;
    // Appends the object's record; false abandons the whole save.
    virtual bool writeToArchive(QuickArchive& ar) = 0;
    // Fills the object from its record; false means the data is not acceptable and
    // the whole load is abandoned (the reason is recorded in the archive).
    virtual bool readFromArchive(QuickArchive& ar) = 0;
};

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
