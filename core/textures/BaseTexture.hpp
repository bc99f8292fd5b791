#pragma once
// The texture family: shading inputs that may own UVW generators, bitmaps, other
// textures and (the sky) a sun light.
#include "archive/Members.hpp"
#include "archive/Serializable.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseTexture : public OrvexSerializable, public OrvexXMLSerializable {
public:
    enum Kind : std::int32_t {
        kBitmap = 0,
        kFresnel = 1,
        kUVW = 2,
        kNoise = 3,
        kChecker = 4,
        kAColor = 5,
        kGrid = 6,
        kCloth = 7,
        kBulge = 8,
        kInvert = 9,
        kBlend = 10,
        kRamp = 11,
        kSky = 12,
    };

    virtual void resetToDefaults() = 0;
    virtual std::int32_t kindId() const = 0;
    virtual boost::shared_ptr<BaseTexture> clone() const = 0;
    virtual bool isEqual(const boost::shared_ptr<BaseTexture>& other) const = 0;

    std::string assetType() const override { return "texture"; }
};

using TexturePtr = boost::shared_ptr<BaseTexture>;

// A new texture of the kind with its defaults; an empty pointer for any other id
// (-1, the stored "no texture", included).
TexturePtr createTexture(std::int32_t kind);

template <>
struct Family<BaseTexture> {
    static constexpr const char* word = "texture";
    static TexturePtr create(std::int32_t kind) { return createTexture(kind); }
};

} // namespace OrvexKavorCore
