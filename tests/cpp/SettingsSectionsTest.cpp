// The XML document of an options set: the twenty-one settings sections as golden
// documents, and what single parameters show for chosen values.
#include "TrimSupport.hpp"

#include <dexmor/options/AllOptions.hpp>
#include <dexmor/textures/SkyTexture.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Parameter `name` of the asset at `url`, its lines without indentation, joined.
std::string parameterOf(const std::string& xml, const std::string& url, const std::string& name) {
    const auto asset = xml.find("url=\"" + url + "\" >");
    if (asset == std::string::npos) return "(no asset " + url + ")";
    const auto at = xml.find(" name=\"" + name + "\" ", asset);
    if (at == std::string::npos || at > xml.find("</Asset>", asset)) return "(no parameter " + name + ")";
    std::string joined;
    for (auto line = xml.rfind('\n', at) + 1;;) {
        const auto end = xml.find('\n', line);
        const std::string text = xml.substr(line, end - line);
        joined += text.substr(text.find_first_not_of(' '));
        if (text.find("</parameter>") != std::string::npos) return joined;
        line = end + 1;
    }
}

} // namespace

TEST(Settings, DefaultDocumentGolden) {
    AllOptions options;
    expectGolden(documentOf(options), "options_default.xml");
}

TEST(Settings, EnvironmentTexturesGolden) {
    AllOptions options;
    options.bg_tex = createTexture(BaseTexture::kChecker), options.gi_tex = createTexture(BaseTexture::kSky);
    options.reflect_tex = createTexture(BaseTexture::kSky), options.refract_tex = createTexture(BaseTexture::kFresnel);
    options.bg_tex_mult = 2.0f, options.refract_mult = 3.0f;
    // The two skies share the default sun: its asset is written once, first.
    expectGolden(documentOf(options), "options_environment_textures.xml");
}

// The parameters of chosen values, one a line, in settings_chosen_parameters.xml.
TEST(Settings, WhatParametersShow) {
    const std::tuple<std::function<void(AllOptions&)>, const char*, const char*> cases[] = {
        // The filter kinds 1 and 2 are exchanged: 2, then 1.
        {[](AllOptions& o) { o.filter_kind = 1; }, "/SettingsImageFilter", "type"},
        {[](AllOptions& o) { o.filter_kind = 2; }, "/SettingsImageFilter", "type"},
        // The multiplier follows whether the texture is set: 3, then 7.
        {[](AllOptions& o) { o.bg_mult = 3, o.bg_tex_mult = 7; }, "/SettingsEnvironment", "bg_mult"},
        {[](AllOptions& o) { o.bg_mult = 3, o.bg_tex_mult = 7, o.bg_tex = createTexture(BaseTexture::kChecker); },
         "/SettingsEnvironment", "bg_mult"},
        // The depth-of-field switch shows the stored inverse: 1, as user data.
        {[](AllOptions& o) { o.inverse_override_focal_dist = 0; }, "/SettingsCameraDof", "override_focal_dist"},
        // Unsigned fields show as signed 32-bit integers: -1.
        {[](AllOptions& o) { o.params.gi.primary_engine = 0xFFFFFFFFu; }, "/SettingsGI", "primary_engine"},
        // Channels by name; an id without a name gives an empty entry.
        {[](AllOptions& o) { o.channels = {126, 99, 133, 123, 125}; }, "/SettingsRenderChannels", "channel_names"},
        // File names: at most 2047 UTF-16 units (the last character would straddle the end).
        {[](AllOptions& o) { o.img_file = std::string(2046, 'x') + "\xF0\x9F\x8E\xAC"; }, "/SettingsOutput",
         "img_file"},
        // Animated camera values show their value at time 0: 50.
        {[](AllOptions& o) { o.camera.focal_length.setValue(85.0f, 10.0), o.camera.focal_length.setValue(50.0f, 0.0); },
         "/CameraPhysical", "focal_length"},
    };
    std::string shown;
    for (const auto& [set, url, name] : cases) {
        AllOptions options;
        set(options);
        shown += parameterOf(documentOf(options), url, name) + "\n";
    }
    // Section urls begin with the prefix the caller gives.
    AllOptions options;
    shown += parameterOf(documentOf(options, "/opts"), "/opts/CameraPhysical", "on") + "\n";
    expectGolden(shown, "settings_chosen_parameters.xml");
}
