// The XML of the options set: twenty-one settings sections, each a renderer plugin
// of asset type "settings" inside an "Assets" element of its own.
//
// Every section is one table of parameters below: the parameter's name, its type
// and the field it shows (one macro per type word: INTEGER, FLOAT, BOOL, STRING,
// COLOR, TEXTURE, CHANNEL_NAMES), then, where they apply, the isUserData flag and a
// label other than the name. Section N of the document is
//
//   <Assets>
//     <Asset layout="" renderer="kavor" type="settings" url="PATH/NAME" >
//       <plugin>
//         <kavorplugin name="NAME" type="settings">
//           <parameters> ... one parameter per row ... </parameters>
//         ...
//   </Assets>
//
// A TEXTURE row refers to a texture that is written as an asset of its own, under
// the url PATH/NAME/CHILD, inside the same "Assets" element ahead of the section's
// asset; an unset texture gives the parameter without a value.
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/options/RenderChannels.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace OrvexKavorCore {

namespace {

// A texture parameter: the texture, and the name of its asset below the section's url.
struct TextureSlot {
    const TexturePtr* texture;
    const char* child;
};
// The channel list, shown by name.
struct ChannelNames {
    const std::vector<std::uint32_t>* ids;
};

// What a parameter shows; the alternative gives the type word: "integer",
// "float", "bool", "string", "color", "plugin", "list" (of strings).
using Value = std::variant<std::int32_t, float, bool, std::string_view, Color, TextureSlot, ChannelNames>;

struct Parameter {
    const char* name;
    Value (*value)(const AllOptions& options);
    bool userData = false; // written as isUserData="1"; "color", "plugin" and "list" never carry it
    const char* label = ""; // empty: the name
};

struct Section {
    const char* name;
    std::span<const Parameter> parameters;
};

constexpr bool kUserData = true;

// The field types each type word shows, checked when the tables compile: an
// "integer" a signed or unsigned 32-bit field (an unsigned value above 2^31 - 1
// as its signed 32-bit value), a "bool" a switch (true when not 0), a "float" a
// 32-bit float, a "string" a file name (as much of it as the options set keeps).
constexpr std::int32_t integer(std::int32_t v) { return v; }
constexpr std::int32_t integer(std::uint32_t v) { return static_cast<std::int32_t>(v); }
template <class T>
std::int32_t integer(T) = delete;
constexpr bool flag(std::int32_t v) { return v != 0; }
constexpr bool flag(bool v) { return v; }
template <class T>
bool flag(T) = delete;
constexpr float real(float v) { return v; }
template <class T>
float real(T) = delete;
std::string_view fileName(const std::string& name) { return AllOptions::fileNameText(name); }

// The renderer numbers the filter kinds 1 and 2 the other way round.
constexpr std::int32_t exchangeOneAndTwo(std::int32_t kind) { return kind == 1 ? 2 : kind == 2 ? 1 : kind; }

#define INTEGER(source) [](const AllOptions& o) -> Value { return integer(source); }
#define FLOAT(source) [](const AllOptions& o) -> Value { return real(source); }
#define BOOL(source) [](const AllOptions& o) -> Value { return flag(source); }
#define STRING(source) [](const AllOptions& o) -> Value { return fileName(source); }
#define COLOR(source) [](const AllOptions& o) -> Value { return Color(source); }
#define TEXTURE(source, child) [](const AllOptions& o) -> Value { return TextureSlot{&(source), child}; }
#define CHANNEL_NAMES(source) [](const AllOptions& o) -> Value { return ChannelNames{&(source)}; }

constexpr Parameter kImageSampler[] = {
    {"type",                            INTEGER(o.params.imageSampler.type)},
    {"fixed_subdivs",                   INTEGER(o.params.imageSampler.fixed_subdivs)},
    {"dmc_minSubdivs",                  INTEGER(o.params.imageSampler.dmc_minSubdivs)},
    {"dmc_maxSubdivs",                  INTEGER(o.params.imageSampler.dmc_maxSubdivs)},
    {"dmc_threshold",                   FLOAT(o.params.imageSampler.dmc_threshold)},
    {"subdivision_minRate",             INTEGER(o.params.imageSampler.subdivision_minRate)},
    {"subdivision_maxRate",             INTEGER(o.params.imageSampler.subdivision_maxRate)},
    {"subdivision_jitter",              BOOL(o.params.imageSampler.subdivision_jitter)},
    {"subdivision_threshold",           FLOAT(o.params.imageSampler.subdivision_threshold)},
    {"subdivision_edges",               BOOL(o.params.imageSampler.subdivision_edges)},
    {"subdivision_normals",             BOOL(o.params.imageSampler.subdivision_normals)},
    {"subdivision_normals_threshold",   FLOAT(o.params.imageSampler.subdivision_normals_threshold)},
    {"subdivision_show_samples",        BOOL(o.params.imageSampler.subdivision_show_samples)},
};

constexpr Parameter kImageFilter[] = {
    {"on",                              BOOL(o.params.imageFilter.on)},
    {"type",                            INTEGER(exchangeOneAndTwo(o.filter_kind))},
    {"size",                            FLOAT(o.filter_size)},
};

constexpr Parameter kCamera[] = {
    {"type",                            INTEGER(o.params.camera.type)},
    {"height",                          FLOAT(o.frameData.height)},
    {"dist",                            FLOAT(o.frameData.dist)},
    {"fov",                             FLOAT(o.fov)},
    {"auto_fit",                        BOOL(o.frameData.auto_fit)},
    {"curve",                           FLOAT(o.frameData.curve)},
    {"override_fov",                    BOOL(o.override_fov),                               kUserData},
};

constexpr Parameter kCameraDof[] = {
    {"override_focal_dist",             BOOL(o.inverse_override_focal_dist == 0),           kUserData},
    {"on",                              BOOL(o.params.cameraDof.on)},
    {"aperture",                        FLOAT(o.frameData.aperture)},
    {"center_bias",                     FLOAT(o.params.cameraDof.center_bias)},
    {"focal_dist",                      FLOAT(o.frameData.focal_dist)},
    {"sides_on",                        BOOL(o.params.cameraDof.sides_on)},
    {"sides_num",                       INTEGER(o.params.cameraDof.sides_num)},
    {"rotation",                        FLOAT(o.frameData.rotation)},
    {"anisotropy",                      FLOAT(o.params.cameraDof.anisotropy)},
    {"subdivs",                         INTEGER(o.params.cameraDof.subdivs)},
};

constexpr Parameter kMotionBlur[] = {
    {"on",                              BOOL(o.params.motionBlur.on)},
    {"geom_samples",                    INTEGER(o.params.motionBlur.geom_samples)},
    {"low_samples",                     INTEGER(o.params.motionBlur.low_samples)},
    {"duration",                        FLOAT(o.params.motionBlur.duration)},
    {"subdivs",                         INTEGER(o.params.motionBlur.subdivs)},
    {"bias",                            FLOAT(o.params.motionBlur.bias)},
    {"interval_center",                 FLOAT(o.params.motionBlur.interval_center)},
};

constexpr Parameter kGI[] = {
    {"on",                              BOOL(o.params.gi.on)},
    {"refract_caustics",                BOOL(o.params.gi.refract_caustics)},
    {"reflect_caustics",                BOOL(o.params.gi.reflect_caustics)},
    {"saturation",                      FLOAT(o.params.gi.saturation)},
    {"contrast",                        FLOAT(o.params.gi.contrast)},
    {"contrast_base",                   FLOAT(o.params.gi.contrast_base)},
    {"primary_engine",                  INTEGER(o.params.gi.primary_engine)},
    {"primary_multiplier",              FLOAT(o.params.gi.primary_multiplier)},
    {"secondary_engine",                INTEGER(o.params.gi.secondary_engine)},
    {"secondary_multiplier",            FLOAT(o.params.gi.secondary_multiplier)},
    {"save_maps_per_frame",             BOOL(o.params.gi.save_maps_per_frame)},
};

constexpr Parameter kIrradianceMap[] = {
    {"min_rate",                        INTEGER(o.params.irradianceMap.min_rate)},
    {"max_rate",                        INTEGER(o.params.irradianceMap.max_rate)},
    {"subdivs",                         INTEGER(o.params.irradianceMap.subdivs)},
    {"interp_samples",                  INTEGER(o.params.irradianceMap.interp_samples)},
    {"calc_interp_samples",             INTEGER(o.params.irradianceMap.calc_interp_samples)},
    {"interp_frames",                   INTEGER(o.params.irradianceMap.interp_frames)},
    {"color_threshold",                 FLOAT(o.params.irradianceMap.color_threshold)},
    {"normal_threshold",                FLOAT(o.params.irradianceMap.normal_threshold)},
    {"distance_threshold",              FLOAT(o.params.irradianceMap.distance_threshold)},
    {"detail_enhancement",              BOOL(o.params.irradianceMap.detail_enhancement)},
    {"detail_radius",                   FLOAT(o.params.irradianceMap.detail_radius)},
    {"detail_subdivs_mult",             FLOAT(o.params.irradianceMap.detail_subdivs_mult)},
    {"detail_scale",                    INTEGER(o.params.irradianceMap.detail_scale)},
    {"randomize_samples",               BOOL(o.params.irradianceMap.randomize_samples)},
    {"interpolation_mode",              INTEGER(o.params.irradianceMap.interpolation_mode)},
    {"lookup_mode",                     INTEGER(o.params.irradianceMap.lookup_mode)},
    {"mode",                            INTEGER(o.params.irradianceMap.mode)},
    {"dont_delete",                     BOOL(o.params.irradianceMap.dont_delete)},
    {"file",                            STRING(o.im_file)},
    {"show_samples",                    BOOL(o.params.irradianceMap.show_samples)},
    {"show_calc_phase",                 BOOL(o.params.irradianceMap.show_calc_phase)},
    {"show_direct_light",               BOOL(o.params.irradianceMap.show_direct_light)},
    {"multiple_views",                  BOOL(o.params.irradianceMap.multiple_views)},
    {"multipass",                       BOOL(o.params.irradianceMap.multipass)},
    {"check_sample_visibility",         BOOL(o.params.irradianceMap.check_sample_visibility)},
    {"auto_save",                       BOOL(o.params.irradianceMap.auto_save)},
    {"auto_save_file",                  STRING(o.im_auto_save_file)},
};

constexpr Parameter kPhotonMap[] = {
    {"bounces",                         INTEGER(o.params.photonMap.bounces)},
    {"max_photons",                     INTEGER(o.params.photonMap.max_photons)},
    {"prefilter",                       BOOL(o.params.photonMap.prefilter)},
    {"prefilter_samples",               INTEGER(o.params.photonMap.prefilter_samples)},
    {"mode",                            INTEGER(o.params.photonMap.mode)},
    {"file",                            STRING(o.pm_file)},
    {"auto_search_distance",            BOOL(o.params.photonMap.auto_search_distance)},
    {"search_distance",                 FLOAT(o.params.photonMap.search_distance)},
    {"convex_hull_estimate",            BOOL(o.params.photonMap.convex_hull_estimate)},
    {"dont_delete",                     BOOL(o.params.photonMap.dont_delete)},
    {"auto_save",                       BOOL(o.params.photonMap.auto_save)},
    {"auto_save_file",                  STRING(o.pm_auto_save_file)},
    {"store_direct_light",              BOOL(o.params.photonMap.store_direct_light)},
    {"multiplier",                      FLOAT(o.params.photonMap.multiplier)},
    {"max_density",                     FLOAT(o.params.photonMap.max_density)},
    {"retrace_corners",                 FLOAT(o.params.photonMap.retrace_corners)},
    {"retrace_bounces",                 INTEGER(o.params.photonMap.retrace_bounces)},
    {"show_calc_phase",                 BOOL(o.params.photonMap.show_calc_phase)},
    // The search distance switch has no field of its own: it shows auto_search_distance.
    {"search_distance_toggle",          BOOL(o.params.photonMap.auto_search_distance),      kUserData},
};

constexpr Parameter kLightCache[] = {
    {"subdivs",                         INTEGER(o.params.lightCache.subdivs)},
    {"sample_size",                     FLOAT(o.params.lightCache.sample_size)},
    {"filter_type",                     INTEGER(o.params.lightCache.filter_type)},
    {"filter_samples",                  INTEGER(o.params.lightCache.filter_samples)},
    {"filter_size",                     FLOAT(o.params.lightCache.filter_size)},
    {"prefilter",                       INTEGER(o.params.lightCache.prefilter)},
    {"prefilter_samples",               BOOL(o.params.lightCache.prefilter_samples)},  // a bool, as consumers expect
    {"depth",                           INTEGER(o.params.lightCache.depth)},
    {"show_calc_phase",                 BOOL(o.params.lightCache.show_calc_phase)},
    {"store_direct_light",              BOOL(o.params.lightCache.store_direct_light)},
    {"world_scale",                     INTEGER(o.params.lightCache.world_scale)},
    {"mode",                            INTEGER(o.params.lightCache.mode)},
    {"file",                            STRING(o.lc_file)},
    {"dont_delete",                     BOOL(o.params.lightCache.dont_delete)},
    {"auto_save",                       BOOL(o.params.lightCache.auto_save)},
    {"auto_save_file",                  STRING(o.lc_auto_save_file)},
    {"num_passes",                      INTEGER(o.params.lightCache.num_passes)},
    {"use_for_glossy_rays",             BOOL(o.params.lightCache.use_for_glossy_rays)},
    {"adaptive_sampling",               BOOL(o.params.lightCache.adaptive_sampling)},
    {"multiple_views",                  BOOL(o.params.lightCache.multiple_views)},
    {"min_paths_per_sample",            INTEGER(o.params.lightCache.min_paths_per_sample)},
    {"adaptive_dirs_only",              BOOL(o.params.lightCache.adaptive_dirs_only)},
};

constexpr Parameter kCaustics[] = {
    {"on",                              BOOL(o.params.caustics.on)},
    {"max_photons",                     INTEGER(o.params.caustics.max_photons)},
    {"search_distance",                 FLOAT(o.params.caustics.search_distance)},
    {"max_density",                     FLOAT(o.params.caustics.max_density)},
    {"multiplier",                      FLOAT(o.params.caustics.multiplier)},
    {"mode",                            INTEGER(o.params.caustics.mode)},
    {"file",                            STRING(o.caustics_file)},
    {"dont_delete",                     BOOL(o.params.caustics.dont_delete)},
    {"auto_save",                       BOOL(o.params.caustics.auto_save)},
    {"auto_save_file",                  STRING(o.caustics_auto_save_file)},
    {"show_calc_phase",                 BOOL(o.params.caustics.show_calc_phase)},
};

constexpr Parameter kRaycaster[] = {
    {"maxLevels",                       INTEGER(o.params.raycaster.maxLevels)},
    {"minLeafSize",                     FLOAT(o.params.raycaster.minLeafSize)},
    {"faceLevelCoef",                   FLOAT(o.params.raycaster.faceLevelCoef)},
    {"dynMemLimit",                     INTEGER(o.params.raycaster.dynMemLimit)},
    {"optLevel",                        INTEGER(o.params.raycaster.optLevel)},
};

constexpr Parameter kRegionsGenerator[] = {
    {"xc",                              INTEGER(o.params.regionsGenerator.xc)},
    {"yc",                              INTEGER(o.params.regionsGenerator.yc)},
    {"xymeans",                         INTEGER(o.params.regionsGenerator.xymeans)},
    {"seqtype",                         INTEGER(o.params.regionsGenerator.seqtype)},
    {"reverse",                         INTEGER(o.params.regionsGenerator.reverse)},
};

constexpr Parameter kDMCGI[] = {
    {"subdivs",                         INTEGER(o.params.gi.subdivs)},
    {"depth",                           INTEGER(o.params.gi.depth)},
};

constexpr Parameter kDMCSampler[] = {
    {"time_dependent",                  BOOL(o.params.dmcSampler.time_dependent)},
    {"adaptive_amount",                 FLOAT(o.params.dmcSampler.adaptive_amount)},
    {"adaptive_threshold",              FLOAT(o.params.dmcSampler.adaptive_threshold)},
    {"adaptive_min_samples",            INTEGER(o.params.dmcSampler.adaptive_min_samples)},
    {"subdivs_mult",                    FLOAT(o.params.dmcSampler.subdivs_mult)},
    {"path_sampler_type",               INTEGER(o.params.dmcSampler.path_sampler_type)},
};

constexpr Parameter kColorMapping[] = {
    {"gamma_correct_rgb",               BOOL(o.gamma_correct_rgb),                          kUserData},
    {"gamma_correct_ldr_textures",      BOOL(o.gamma_correct_ldr_textures),                 kUserData},
    {"input_gamma",                     FLOAT(o.input_gamma),                               kUserData},
    {"type",                            INTEGER(o.params.colorMapping.type)},
    {"affect_background",               BOOL(o.params.colorMapping.affect_background)},
    {"dark_mult",                       FLOAT(o.frameData.dark_mult)},
    {"bright_mult",                     FLOAT(o.frameData.bright_mult)},
    {"gamma",                           FLOAT(o.params.colorMapping.gamma)},
    {"subpixel_mapping",                BOOL(o.params.colorMapping.subpixel_mapping)},
    {"clamp_output",                    BOOL(o.params.colorMapping.clamp_output)},
    {"clamp_level",                     FLOAT(o.params.colorMapping.clamp_level)},
    {"adaptation_only",                 BOOL(o.params.colorMapping.adaptation_only)},
    {"linearWorkflow",                  BOOL(o.params.colorMapping.linearWorkflow)},
};

constexpr Parameter kRenderChannels[] = {
    {"zdepth_clamp",                    BOOL(o.zdepth_clamp)},
    {"zdepth_black",                    FLOAT(o.zdepth_black)},
    {"zdepth_white",                    FLOAT(o.zdepth_white)},
    {"channel_names",                   CHANNEL_NAMES(o.channels),                          false, "VFB Channels"},
};

constexpr Parameter kOptions[] = {
    {"geom_displacement",               BOOL(o.params.options.geom_displacement)},
    {"geom_doHidden",                   BOOL(o.params.options.geom_doHidden)},
    {"light_doLights",                  BOOL(o.params.options.light_doLights)},
    {"light_doDefaultLights",           BOOL(o.params.options.light_doDefaultLights)},
    {"light_doHiddenLights",            BOOL(o.params.options.light_doHiddenLights)},
    {"light_doShadows",                 BOOL(o.params.options.light_doShadows)},
    {"light_onlyGI",                    BOOL(o.params.options.light_onlyGI)},
    {"gi_dontRenderImage",              BOOL(o.params.options.gi_dontRenderImage)},
    {"mtl_reflectionRefraction",        BOOL(o.params.options.mtl_reflectionRefraction)},
    {"mtl_limitDepth",                  BOOL(o.params.options.mtl_limitDepth)},
    {"mtl_maxDepth",                    INTEGER(o.params.options.mtl_maxDepth)},
    {"mtl_doMaps",                      BOOL(o.params.options.mtl_doMaps)},
    {"mtl_filterMaps",                  BOOL(o.params.options.mtl_filterMaps)},
    {"mtl_filterMapsForSecondaryRays",  BOOL(o.params.options.mtl_filterMapsForSecondaryRays)},
    {"mtl_transpMaxLevels",             INTEGER(o.params.options.mtl_transpMaxLevels)},
    {"mtl_transpCutoff",                FLOAT(o.params.options.mtl_transpCutoff)},
    {"mtl_override_on",                 BOOL(o.params.options.mtl_override_on)},
    {"mtl_glossy",                      BOOL(o.params.options.mtl_glossy)},
    {"geom_backfaceCull",               BOOL(o.params.options.geom_backfaceCull)},
    {"ray_bias",                        FLOAT(o.params.options.ray_bias)},
    {"misc_lowThreadPriority",          BOOL(o.params.options.misc_lowThreadPriority)},
};

constexpr Parameter kDefaultDisplacement[] = {
    {"override_on",                     BOOL(o.params.defaultDisplacement.override_on)},
    {"edgeLength",                      FLOAT(o.params.defaultDisplacement.edgeLength)},
    {"viewDependent",                   BOOL(o.params.defaultDisplacement.viewDependent)},
    {"maxSubdivs",                      INTEGER(o.params.defaultDisplacement.maxSubdivs)},
    {"tightBounds",                     BOOL(o.params.defaultDisplacement.tightBounds)},
    {"amount",                          FLOAT(o.params.defaultDisplacement.amount)},
    {"relative",                        BOOL(o.params.defaultDisplacement.relative)},
};

// Each multiplier shows the texture's multiplier while the texture is set, and the
// colour's otherwise.
constexpr Parameter kEnvironment[] = {
    {"use_bg",                          BOOL(o.use_bg)},
    {"bg_color",                        COLOR(o.bg_color)},
    {"bg_tex",                          TEXTURE(o.bg_tex, "bg_texture")},
    {"bg_mult",                         FLOAT(o.bg_tex ? o.bg_tex_mult : o.bg_mult)},
    {"use_gi",                          BOOL(o.use_gi)},
    {"gi_color",                        COLOR(o.gi_color)},
    {"gi_tex",                          TEXTURE(o.gi_tex, "gi_texture")},
    {"gi_mult",                         FLOAT(o.gi_tex ? o.gi_tex_mult : o.gi_mult)},
    {"use_reflect",                     BOOL(o.use_reflect)},
    {"reflect_color",                   COLOR(o.reflect_color)},
    {"reflect_tex",                     TEXTURE(o.reflect_tex, "reflect_texture")},
    {"reflect_mult",                    FLOAT(o.reflect_tex ? o.reflect_tex_mult : o.reflect_mult)},
    {"use_refract",                     BOOL(o.use_refract)},
    {"refract_color",                   COLOR(o.refract_color)},
    {"refract_tex",                     TEXTURE(o.refract_tex, "refract_texture")},
    {"refract_mult",                    FLOAT(o.refract_tex ? o.refract_tex_mult : o.refract_mult)},
};

constexpr Parameter kOutput[] = {
    {"img_width",                       INTEGER(o.img_width)},
    {"img_height",                      INTEGER(o.img_height)},
    {"img_pixelAspect",                 FLOAT(o.img_pixelAspect)},
    {"img_file",                        STRING(o.img_file)},
    {"img_rawFile",                     BOOL(o.img_rawFile)},
    {"frames_per_second",               FLOAT(o.frames_per_second)},
    {"rgn_left",                        FLOAT(o.frameData.rgn_left)},
    {"rgn_width",                       FLOAT(o.frameData.rgn_width)},
    {"rgn_top",                         FLOAT(o.frameData.rgn_top)},
    {"rgn_height",                      FLOAT(o.frameData.rgn_height)},
    {"bmp_width",                       INTEGER(o.frameData.bmp_width)},
    {"bmp_height",                      INTEGER(o.frameData.bmp_height)},
    {"r_left",                          INTEGER(o.frameData.r_left)},
    {"r_width",                         INTEGER(o.frameData.r_width)},
    {"r_top",                           INTEGER(o.frameData.r_top)},
    {"r_height",                        INTEGER(o.frameData.r_height)},
    {"kvimg_file",                      STRING(o.kvimg_file),                               kUserData, "KVImage Output File"},
    {"override_viewport",               BOOL(o.override_viewport),                          kUserData, "Override Viewport"},
    {"do_animation",                    BOOL(o.do_animation),                               kUserData},
    {"save_render",                     BOOL(o.save_render),                                kUserData},
    {"frame_rate",                      INTEGER(o.frame_rate),                              kUserData},
};

constexpr Parameter kCameraPhysical[] = {
    {"on",                              BOOL(o.physical_on)},
    {"type",                            INTEGER(o.camera.type)},
    {"film_width",                      FLOAT(o.camera.film_width)},
    {"focal_length",                    FLOAT(o.camera.focal_length.valueAt(0.0))},
    {"zoom_factor",                     FLOAT(o.camera.zoom_factor)},
    {"distortion",                      FLOAT(o.camera.distortion)},
    {"f_number",                        FLOAT(o.camera.f_number)},
    {"lens_shift",                      FLOAT(o.camera.lens_shift)},
    {"shutter_speed",                   FLOAT(o.camera.shutter_speed)},
    {"shutter_angle",                   FLOAT(o.camera.shutter_angle)},
    {"shutter_offset",                  FLOAT(o.camera.shutter_offset)},
    {"latency",                         FLOAT(o.camera.latency)},
    {"ISO",                             FLOAT(o.camera.ISO)},
    {"specify_focus",                   BOOL(o.camera.specify_focus)},
    {"focus_distance",                  FLOAT(o.camera.focus_distance.valueAt(0.0))},
    {"targeted",                        BOOL(o.camera.targeted)},
    {"target_distance",                 FLOAT(o.camera.target_distance)},
    {"dof_display_threshold",           FLOAT(o.camera.dof_display_threshold)},
    {"exposure",                        BOOL(o.camera.exposure)},
    {"white_balance",                   COLOR(o.camera.white_balance)},
    {"vignetting",                      BOOL(o.camera.vignetting)},
    {"blades_enable",                   BOOL(o.camera.blades_enable)},
    {"blades_num",                      INTEGER(o.camera.blades_num)},
    {"blades_rotation",                 FLOAT(o.camera.blades_rotation)},
    {"center_bias",                     FLOAT(o.camera.center_bias)},
    {"anisotropy",                      FLOAT(o.camera.anisotropy)},
    {"use_dof",                         BOOL(o.camera.use_dof)},
    {"use_moblur",                      BOOL(o.camera.use_moblur)},
    {"subdivs",                         INTEGER(o.camera.subdivs)},
    {"specify_film_width",              BOOL(o.specify_film_width),                         kUserData},
    {"override_focal_length",           BOOL(o.override_focal_length),                      kUserData},
};

// The sections in document order.
constexpr Section kSections[] = {
    {"SettingsImageSampler",            kImageSampler},
    {"SettingsImageFilter",             kImageFilter},
    {"SettingsCamera",                  kCamera},
    {"SettingsCameraDof",               kCameraDof},
    {"SettingsMotionBlur",              kMotionBlur},
    {"SettingsGI",                      kGI},
    {"SettingsIrradianceMap",           kIrradianceMap},
    {"SettingsPhotonMap",               kPhotonMap},
    {"SettingsLightCache",              kLightCache},
    {"SettingsCaustics",                kCaustics},
    {"SettingsRaycaster",               kRaycaster},
    {"SettingsRegionsGenerator",        kRegionsGenerator},
    {"SettingsDMCGI",                   kDMCGI},
    {"SettingsDMCSampler",              kDMCSampler},
    {"SettingsColorMapping",            kColorMapping},
    {"SettingsRenderChannels",          kRenderChannels},
    {"SettingsOptions",                 kOptions},
    {"SettingsDefaultDisplacement",     kDefaultDisplacement},
    {"SettingsEnvironment",             kEnvironment},
    {"SettingsOutput",                  kOutput},
    {"CameraPhysical",                  kCameraPhysical},
};

#undef INTEGER
#undef FLOAT
#undef BOOL
#undef STRING
#undef COLOR
#undef TEXTURE
#undef CHANNEL_NAMES

static_assert(std::size(kSections) == 21);

// Writes one parameter by the encoding of its type word.
struct WriteParameter {
    AssetXmlWriter& writer;
    const Parameter& p;
    const std::string& sectionUrl;

    void operator()(std::int32_t v) const { writer.writeInteger(p.name, v, p.label, p.userData); }
    void operator()(float v) const { writer.writeFloat(p.name, v, p.label, p.userData); }
    void operator()(bool v) const { writer.writeBool(p.name, v, p.label, p.userData); }
    void operator()(std::string_view v) const { writer.writeString(p.name, v, p.label, p.userData); }
    void operator()(const Color& v) const { writer.writeColor(p.name, v, p.label); }
    // The reference names the plugin inside the texture's asset; an unset texture
    // gives the parameter without a value.
    void operator()(const TextureSlot& slot) const {
        writer.writePlugin(p.name, *slot.texture, sectionUrl + "/" + slot.child, p.label);
    }
    // One entry per id, in list order; an id without a name gives an empty entry.
    void operator()(const ChannelNames& channels) const {
        writer.beginList(p.name, "string", p.label);
        for (std::uint32_t id : *channels.ids) writer.writeEntry(renderChannelName(id));
        writer.endList();
    }
};

void writeSection(AssetXmlWriter& writer, const Section& section, const AllOptions& options,
                  const std::string& type, const std::string& path) {
    const std::string url = path + "/" + section.name;
    writer.beginElement("Assets");
    // The textures the section refers to come first, each an asset of its own.
    for (const Parameter& p : section.parameters) {
        const Value value = p.value(options);
        if (const auto* slot = std::get_if<TextureSlot>(&value); slot && *slot->texture)
            (*slot->texture)->writeXml(writer, url + "/" + slot->child);
    }
    writer.beginAsset(url, type, "");
    writer.beginPlugin(section.name, type);
    writer.beginParameters();
    for (const Parameter& p : section.parameters) std::visit(WriteParameter{writer, p, url}, p.value(options));
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
    writer.endElement("Assets");
}

} // namespace

void AllOptions::writeXml(AssetXmlWriter& writer, std::string path) {
    const std::string type = assetType();
    for (const Section& section : kSections) writeSection(writer, section, *this, type, path);
}

} // namespace OrvexKavorCore
