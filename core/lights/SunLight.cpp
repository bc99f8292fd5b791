#include <dexmor/lights/SunLight.hpp>

#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <utility>

namespace OrvexKavorCore {

namespace {

#define LIGHT_FIELD(member, ...) record::field<&SunLight::member>(#member __VA_OPT__(, ) __VA_ARGS__)
#define LIGHT_PARAM(member) lightxml::param<&SunLight::member>(#member)

using record::between;
using record::since;

// Record version 4. Versions 1 to 3 store the placement first, as a plain
// Transform that becomes its value at time 0; version 4 stores its record last.
constexpr std::array kFields = {
    record::fieldAs<record::AnimatedPlainValue, &SunLight::transform>("transform (plain)", between(1, 3)),
    LIGHT_FIELD(up_vector),
    LIGHT_FIELD(shadowBias),
    LIGHT_FIELD(turbidity),
    LIGHT_FIELD(water_vapour),
    LIGHT_FIELD(intensity_multiplier),
    LIGHT_FIELD(size_multiplier),
    LIGHT_FIELD(photon_radius),
    LIGHT_FIELD(photon_emit_distance),
    LIGHT_FIELD(ozone),
    LIGHT_FIELD(photonSubdivs),
    LIGHT_FIELD(causticSubdivs),
    LIGHT_FIELD(shadow_subdivs),
    LIGHT_FIELD(shadows),
    LIGHT_FIELD(identifier, since(2)),
    LIGHT_FIELD(name, since(2)),
    LIGHT_FIELD(enabled, since(3)),
    LIGHT_FIELD(invisible, since(3)),
    LIGHT_FIELD(transform, since(4)),
};

constexpr std::array kXml = {
    LIGHT_PARAM(up_vector),     LIGHT_PARAM(shadowBias),           LIGHT_PARAM(turbidity),
    LIGHT_PARAM(water_vapour),  LIGHT_PARAM(intensity_multiplier), LIGHT_PARAM(size_multiplier),
    LIGHT_PARAM(photon_radius), LIGHT_PARAM(photon_emit_distance), LIGHT_PARAM(ozone),
    LIGHT_PARAM(photonSubdivs), LIGHT_PARAM(causticSubdivs),       LIGHT_PARAM(shadow_subdivs),
    LIGHT_PARAM(enabled),       LIGHT_PARAM(shadows),              LIGHT_PARAM(invisible),
};

#undef LIGHT_FIELD
#undef LIGHT_PARAM

} // namespace

std::span<const record::Field<SunLight>> SunLight::recordFields() { return kFields; }
std::span<const lightxml::Parameter<SunLight>> SunLight::xmlParameters() { return kXml; }

SunLight::SunLight(std::string sunName, std::string sunIdentifier)
    : identifier(std::move(sunIdentifier)), name(std::move(sunName)) {}

void SunLight::writeXml(AssetXmlWriter& writer, std::string /*path*/) {
    auto& urls = PerConversion<DocumentSunUrls>::current().urls;
    if (urls.count(identifier) != 0) return;
    std::string url = "/" + pluginType();
    if (!urls.empty()) url += std::to_string(urls.size());
    urls.emplace(identifier, url);
    writeAsset(writer, url);
}

std::string DocumentSunUrls::urlOf(const std::string& identifier) {
    const auto& urls = PerConversion<DocumentSunUrls>::current().urls;
    const auto found = urls.find(identifier);
    return found == urls.end() ? std::string() : found->second;
}

} // namespace OrvexKavorCore
