#include "textures/BaseBitmap.hpp"

namespace OrvexKavorCore {

BitmapPtr createBitmap(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
