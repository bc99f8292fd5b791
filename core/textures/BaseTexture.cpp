#include <dexmor/textures/BaseTexture.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/textures/BitmapTexture.hpp>
#include <dexmor/textures/ColorTextures.hpp>
#include <dexmor/textures/PatternTextures.hpp>
#include <dexmor/textures/SkyTexture.hpp>

#include <boost/make_shared.hpp>

#include <new>
#include <utility>

namespace OrvexKavorCore {

TexturePtr createTexture(std::int32_t kind) {
    switch (kind) {
    case BaseTexture::kBitmap:
        return boost::make_shared<BitmapTexture>();
    case BaseTexture::kFresnel:
        return boost::make_shared<FresnelTexture>();
    case BaseTexture::kUVW:
        return boost::make_shared<UVWTexture>();
    case BaseTexture::kNoise:
        return boost::make_shared<NoiseTexture>();
    case BaseTexture::kChecker:
        return boost::make_shared<CheckerTexture>();
    case BaseTexture::kAColor:
        return boost::make_shared<AColorTexture>();
    case BaseTexture::kGrid:
        return boost::make_shared<GridTexture>();
    case BaseTexture::kCloth:
        return boost::make_shared<ClothTexture>();
    case BaseTexture::kBulge:
        return boost::make_shared<BulgeTexture>();
    case BaseTexture::kInvert:
        return boost::make_shared<InvertTexture>();
    case BaseTexture::kBlend:
        return boost::make_shared<BlendTexture>();
    case BaseTexture::kRamp:
        return boost::make_shared<RampTexture>();
    case BaseTexture::kSky:
        return boost::make_shared<SkyTexture>();
    default:
        return {};
    }
}

void BaseTexture::releaseTextureMembers() noexcept {
    std::vector<TexturePtr> pending;
    try {
        takeTextureMembers(pending);
        while (!pending.empty()) {
            TexturePtr next = std::move(pending.back());
            pending.pop_back();
            // The last owner empties the texture before letting it go, so its own
            // destruction has nothing left to recurse into. A texture held elsewhere
            // as well is only released here.
            if (next.use_count() == 1) next->takeTextureMembers(pending);
        }
    } catch (const std::bad_alloc&) {
        // Without memory for the list, the rest is released the ordinary way.
    }
}

} // namespace OrvexKavorCore
