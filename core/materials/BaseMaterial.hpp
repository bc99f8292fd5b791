#pragma once
// The material family: every material of a library derives from BaseMaterial.
#include "archive/Members.hpp"
#include "archive/Serializable.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseMaterial : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // Material kind ids, stored in front of every material record.
    enum Kind : std::int32_t {
        kSingleBRDF = 0,
        kLayeredBRDF = 1,
        kMulti = 2,
        kBump = 3,
        kInstance = 4,
        k2Sided = 5,
        kLinked = 6,
        kSkp2Sided = 7,
        kOverrideEnvironment = 8,
        kDisplaced = 9,
        kObjectExclusion = 10,
        kAlphaContribution = 11,
        kAngleBlend = 12,
        kReference = 13,
        kToon = 14,
    };

    // The material's name: also the last part of its asset url.
    std::string name;
    // The identifier (UUID text) under which the scene library maps the material.
    std::string identifier;

    virtual std::int32_t kindId() const = 0;
    virtual void resetToDefaults() = 0;
    // Deep copy that receives a new unique name.
    virtual boost::shared_ptr<BaseMaterial> cloneRenamed() const = 0;
    // Deep copy that keeps the name.
    virtual boost::shared_ptr<BaseMaterial> clone() const = 0;
    // Same kind and same content; names and identifiers are not compared.
    virtual bool isEqual(const boost::shared_ptr<BaseMaterial>& other) const = 0;

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return "material"; }
};

using MaterialPtr = boost::shared_ptr<BaseMaterial>;

// A new material of the kind with its defaults, or an empty pointer for an id
// outside the table.
MaterialPtr createMaterial(std::int32_t kind);

template <>
struct Family<BaseMaterial> {
    static constexpr const char* word = "material";
    static MaterialPtr create(std::int32_t kind) { return createMaterial(kind); }
};

} // namespace OrvexKavorCore
