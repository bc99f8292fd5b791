#pragma once
// The texture family: shading inputs that may own UVW generators, bitmaps, other
// textures and (the sky) a sun light. Textures form trees; every walk over a tree
// (reading, writing, XML, copying, comparing, inverting, destroying) is bounded so
// that a very deep tree cannot overflow the stack.
#include <dexmor/archive/Members.hpp>
#include <dexmor/model/WalkGuard.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>
#include <vector>

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
    static constexpr std::int32_t kKindCount = 13;

    virtual void resetToDefaults() = 0;
    virtual std::int32_t kindId() const = 0;
    // The deep copy: member objects are copied too. Empty only for a texture nested
    // deeper than the walk limit.
    virtual boost::shared_ptr<BaseTexture> clone() const = 0;
    // Same kind and same content, members compared by their own isEqual.
    virtual bool isEqual(const boost::shared_ptr<BaseTexture>& other) const = 0;

    std::string assetType() const override { return "texture"; }

    // One level of a recursive walk over a texture tree (see WalkGuard): a level
    // beyond the nesting limit is refused, and the walk stops there (a write
    // fails, a comparison is false, a copy or an XML asset stops at that level).
    class Descent : public WalkGuard {
    public:
        Descent() : WalkGuard(kTextures) {}
    };

protected:
    // Moves the texture members of this object into `out`. Kinds that hold
    // textures override it.
    virtual void takeTextureMembers(std::vector<boost::shared_ptr<BaseTexture>>& out) { (void)out; }
    // Releases the texture members one by one instead of recursively, so that
    // destroying a chain of any depth takes constant stack. Every kind that holds
    // textures calls it from its destructor.
    void releaseTextureMembers() noexcept;
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
