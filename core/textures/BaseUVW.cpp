#include "textures/BaseUVW.hpp"

namespace OrvexKavorCore {

UVWPtr createUVW(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
