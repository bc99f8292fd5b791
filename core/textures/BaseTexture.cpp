#include "textures/BaseTexture.hpp"

namespace OrvexKavorCore {

TexturePtr createTexture(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
