#include "brdfs/Base_BRDF.hpp"

namespace OrvexKavorCore {

BRDFPtr createBRDF(std::int32_t kind) {
    switch (kind) {
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
