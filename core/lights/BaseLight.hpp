#pragma once
// The light family. In stored files a light appears only as the sun of a sky texture.
#include "archive/Members.hpp"
#include "archive/Serializable.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

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

LightPtr createLight(std::int32_t kind);

template <>
struct Family<BaseLight> {
    static constexpr const char* word = "light";
    static LightPtr create(std::int32_t kind) { return createLight(kind); }
};

} // namespace OrvexKavorCore
