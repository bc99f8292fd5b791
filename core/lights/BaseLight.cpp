#include "lights/BaseLight.hpp"

namespace OrvexKavorCore {

LightPtr createLight(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
