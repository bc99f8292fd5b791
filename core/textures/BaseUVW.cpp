#include <dexmor/textures/BaseUVW.hpp>

#include <dexmor/textures/UVWGenerators.hpp>

#include <boost/make_shared.hpp>

namespace OrvexKavorCore {

UVWPtr createUVW(std::int32_t kind) {
    switch (kind) {
    case BaseUVW::kPlanarWorld:
        return boost::make_shared<GenPlanarWorldUVW>();
    case BaseUVW::kObject:
        return boost::make_shared<GenObjectUVW>();
    case BaseUVW::kEnvironment:
        return boost::make_shared<GenEnvironmentUVW>();
    case BaseUVW::kChannel:
        return boost::make_shared<GenChannelUVW>();
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
