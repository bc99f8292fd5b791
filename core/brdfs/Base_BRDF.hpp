#pragma once
// The BRDF-layer family: the shading layers of a material.
#include "archive/Members.hpp"
#include "archive/Serializable.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class Base_BRDF : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // BRDF kind ids are single bits.
    enum Kind : std::int32_t {
        kGlass = 1,
        kDiffuse = 2,
        kBlinn = 4,
        kPhong = 8,
        kMirror = 16,
        kLight = 32,
    };

    virtual std::int32_t kindId() const = 0;
    virtual void resetToDefaults() = 0;
    virtual boost::shared_ptr<Base_BRDF> clone() const = 0;
    virtual bool isEqual(const boost::shared_ptr<Base_BRDF>& other) const = 0;

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return "BRDF"; }
};

using BRDFPtr = boost::shared_ptr<Base_BRDF>;

// A new BRDF layer of the kind, or an empty pointer for an id outside the table.
BRDFPtr createBRDF(std::int32_t kind);

template <>
struct Family<Base_BRDF> {
    static constexpr const char* word = "BRDF layer";
    static BRDFPtr create(std::int32_t kind) { return createBRDF(kind); }
};

} // namespace OrvexKavorCore
