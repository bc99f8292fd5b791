#pragma once
// The light family. In stored files a light appears only as the sun of a sky texture.
// The kinds are in lights/LightKinds.hpp and lights/SunLight.hpp.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

class BaseLight : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // There is no kind 1 (a positional direct light has no class) and no kind 8.
    enum Kind : std::int32_t {
        kMayaDirect = 0,
        kOmni = 2,
        kRectangle = 3,
        kSpot = 4,
        kSun = 5,
        kIES = 6,
        kSphere = 7,
    };

    virtual std::int32_t kindId() const = 0;
    virtual boost::shared_ptr<BaseLight> clone() const = 0;
    virtual bool isEqual(const boost::shared_ptr<BaseLight>& other) const = 0;
    virtual void resetToDefaults() = 0;

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return "light"; }
};

using LightPtr = boost::shared_ptr<BaseLight>;

// A new light of the kind with its defaults; an empty pointer for an id without a
// class (1, 8, negative ids and every id above 7).
LightPtr createLight(std::int32_t kind);

// The display name of a kind id 0 to 8 ("Omni Light"; 1 is "Positional Direct
// Light", 8 "Invalid Light"); the empty text for any other id.
std::string_view lightKindName(std::int32_t kind);

template <>
struct Family<BaseLight> {
    static constexpr const char* word = "light";
    static LightPtr create(std::int32_t kind) { return createLight(kind); }
};

} // namespace OrvexKavorCore
