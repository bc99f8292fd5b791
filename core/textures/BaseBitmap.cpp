#include <dexmor/textures/BaseBitmap.hpp>

#include <dexmor/textures/BitmapBuffer.hpp>

#include <boost/make_shared.hpp>

namespace OrvexKavorCore {

BitmapPtr createBitmap(std::int32_t kind) {
    switch (kind) {
    case BaseBitmap::kBuffer:
        return boost::make_shared<BitmapBuffer>();
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
