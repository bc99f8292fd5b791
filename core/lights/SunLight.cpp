#include <dexmor/lights/SunLight.hpp>

#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <utility>

namespace OrvexKavorCore {

namespace {

using kind::value;
using record::between;
using record::field;
using record::since;

// Record version 4. Versions 1 to 3 store the placement first, as a plain
// Transform that becomes its value at time 0; version 4 stores its record last.
constexpr std::array kFields = {
    record::fieldAs<record::AnimatedPlainValue, &SunLight::transform>("transform (plain)", between(1, 3)),
    field<&SunLight::up_vector>("up_vector"),
    field<&SunLight::shadowBias>("shadowBias"),
    field<&SunLight::turbidity>("turbidity"),
    field<&SunLight::water_vapour>("water_vapour"),
    field<&SunLight::intensity_multiplier>("intensity_multiplier"),
    field<&SunLight::size_multiplier>("size_multiplier"),
    field<&SunLight::photon_radius>("photon_radius"),
    field<&SunLight::photon_emit_distance>("photon_emit_distance"),
    field<&SunLight::ozone>("ozone"),
    field<&SunLight::photonSubdivs>("photonSubdivs"),
    field<&SunLight::causticSubdivs>("causticSubdivs"),
    field<&SunLight::shadow_subdivs>("shadow_subdivs"),
    field<&SunLight::shadows>("shadows"),
    field<&SunLight::identifier>("identifier", since(2)),
    field<&SunLight::name>("name", since(2)),
    field<&SunLight::enabled>("enabled", since(3)),
    field<&SunLight::invisible>("invisible", since(3)),
    field<&SunLight::transform>("transform", since(4)),
};

constexpr std::array kXml = {
    value<&SunLight::up_vector>("up_vector"),
    value<&SunLight::shadowBias>("shadowBias"),
    value<&SunLight::turbidity>("turbidity"),
    value<&SunLight::water_vapour>("water_vapour"),
    value<&SunLight::intensity_multiplier>("intensity_multiplier"),
    value<&SunLight::size_multiplier>("size_multiplier"),
    value<&SunLight::photon_radius>("photon_radius"),
    value<&SunLight::photon_emit_distance>("photon_emit_distance"),
    value<&SunLight::ozone>("ozone"),
    value<&SunLight::photonSubdivs>("photonSubdivs"),
    value<&SunLight::causticSubdivs>("causticSubdivs"),
    value<&SunLight::shadow_subdivs>("shadow_subdivs"),
    value<&SunLight::enabled>("enabled"),
    value<&SunLight::shadows>("shadows"),
    value<&SunLight::invisible>("invisible"),
};

} // namespace

std::span<const record::Field<SunLight>> SunLight::recordFields() { return kFields; }
std::span<const kind::ParameterRow<SunLight>> SunLight::xmlParameters() { return kXml; }

SunLight::SunLight(std::string sunName, std::string sunIdentifier)
    : identifier(std::move(sunIdentifier)), name(std::move(sunName)) {}

void SunLight::writeXml(AssetXmlWriter& writer, std::string /*path*/) {
    auto& urls = PerConversion<DocumentSunUrls>::current().urls;
    if (urls.count(identifier) != 0) return;
    std::string url = "/";
    url += pluginType();
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
