#pragma once
// The BRDF-layer family: the shading layers of a material.
//
// Every layer carries a name (the last part of its asset url, by default its
// plugin type) and three flags that are stored and copied but neither shown in the
// XML nor compared. They travel in the base record, which the kinds embed in
// their own records:
//   VersionWord (0, 4), WString name, Bool flag1, Bool flag2, Bool flag3
// Older base records: version 1 holds the name only, 2 adds flag1, 3 adds flag2.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

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

    // The layer's name (UTF-8): its asset url is the owner's url, "/" and the name.
    std::string name;
    bool flag1 = true;
    bool flag2 = false;
    bool flag3 = false;

    // The base record alone. The kinds override both with their full records,
    // which hold the base record at their own place.
    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;

    virtual std::int32_t kindId() const = 0;
    // Every field to its default, name and flags included.
    virtual void resetToDefaults() = 0;
    // The deep copy: every field (name and flags too), textures by their own clone.
    virtual boost::shared_ptr<Base_BRDF> clone() const = 0;
    // Same kind, equal textures and every colour, number and integer exactly equal.
    // The name and the flags are not compared.
    virtual bool isEqual(const boost::shared_ptr<Base_BRDF>& other) const = 0;

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return "BRDF"; }

    // The base record: writing always succeeds; reading first resets the name and
    // the flags, then accepts versions (0, 1) to (0, 4).
    bool writeBaseRecord(QuickArchive& ar);
    bool readBaseRecord(QuickArchive& ar);

protected:
    Base_BRDF() = default;
    Base_BRDF(const Base_BRDF&) = default;
    Base_BRDF& operator=(const Base_BRDF&) = default;

    // The name back to the plugin type, the flags to true, false, false.
    void resetBase();
};

using BRDFPtr = boost::shared_ptr<Base_BRDF>;

// A new BRDF layer of the kind with its defaults, or an empty pointer for an id
// outside the table (0, sums of bits, 64 and above, negatives).
BRDFPtr createBRDF(std::int32_t kind);

template <>
struct Family<Base_BRDF> {
    static constexpr const char* word = "BRDF layer";
    static BRDFPtr create(std::int32_t kind) { return createBRDF(kind); }
};

} // namespace OrvexKavorCore
