#include <dexmor/lights/BaseLight.hpp>

#include <dexmor/lights/LightKinds.hpp>
#include <dexmor/lights/SunLight.hpp>

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

constexpr std::array<std::string_view, 9> kKindNames = {
    "Infinite Direct Light", "Positional Direct Light", "Omni Light", "Rectangle Light", "Spot Light",
    "Sun Light",             "IES Light",               "Sphere Light", "Invalid Light",
};

} // namespace

LightPtr createLight(std::int32_t kind) {
    switch (kind) {
    case BaseLight::kMayaDirect:
        return boost::make_shared<MayaDirectLight>();
    case BaseLight::kOmni:
        return boost::make_shared<OmniLight>();
    case BaseLight::kRectangle:
        return boost::make_shared<RectangleLight>();
    case BaseLight::kSpot:
        return boost::make_shared<SpotLight>();
    case BaseLight::kSun:
        return boost::make_shared<SunLight>();
    case BaseLight::kIES:
        return boost::make_shared<IESLight>();
    case BaseLight::kSphere:
        return boost::make_shared<SphereLight>();
    default:
        return {};
    }
}

std::string_view lightKindName(std::int32_t kind) {
    if (kind < 0 || static_cast<std::size_t>(kind) >= kKindNames.size()) return {};
    return kKindNames[static_cast<std::size_t>(kind)];
}

} // namespace OrvexKavorCore
