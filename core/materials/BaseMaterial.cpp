#include "materials/BaseMaterial.hpp"

namespace OrvexKavorCore {

MaterialPtr createMaterial(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
