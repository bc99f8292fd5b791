#pragma once
// KavorParams: the renderer's scalar settings as one plain structure, grouped by
// settings section (image sampler, global illumination engines, colour mapping,
// ...). The member initialisers are the defaults; a value-initialised KavorParams
// is the default block.
//
// Switches are 32-bit integers (0 = off, anything else = on), as the renderer
// keeps them. The engine, mode and filter selectors and a few counters are
// unsigned. The str1/str2 fields hold UTF-8 text; the empty string means "no text".
// Fields marked "not stored" belong to the block but are not part of its record:
// they always come back from a file with their defaults.
//
// The stored record of the block is in OrvexParams.cpp.
#include <cstdint>
#include <string>

namespace KavorUtils {

struct KavorParams {
    struct ImageFilter {
        std::int32_t on = 0;
        friend bool operator==(const ImageFilter&, const ImageFilter&) = default;
    };

    struct ImageSampler {
        std::int32_t type = 0;
        std::int32_t fixed_subdivs = 1;
        std::int32_t dmc_minSubdivs = 1;
        std::int32_t dmc_maxSubdivs = 4;
        float dmc_threshold = 0.01f;
        std::int32_t subdivision_minRate = -1;
        std::int32_t subdivision_maxRate = 2;
        float subdivision_threshold = 0.1f;
        std::int32_t subdivision_jitter = 1;
        std::int32_t subdivision_show_samples = 0; // not stored
        std::int32_t subdivision_edges = 1;
        std::int32_t aux1 = 0;
        std::int32_t subdivision_normals = 0;
        float subdivision_normals_threshold = 0.1f;
        std::int32_t aux2 = 0;
        float aux3 = 0.0f;
        friend bool operator==(const ImageSampler&, const ImageSampler&) = default;
    };

    struct Camera {
        std::int32_t type = 0;
        friend bool operator==(const Camera&, const Camera&) = default;
    };

    struct CameraDof {
        std::int32_t on = 0;
        std::int32_t subdivs = 6;
        float center_bias = 0.0f;
        std::int32_t sides_on = 0;
        std::int32_t sides_num = 5;
        float anisotropy = 0.0f;
        friend bool operator==(const CameraDof&, const CameraDof&) = default;
    };

    struct MotionBlur {
        std::int32_t on = 0;
        std::int32_t geom_samples = 2;
        std::int32_t aux1 = 0;
        std::int32_t aux2 = 6;
        std::int32_t subdivs = 6;
        float aux3 = 0.0f;
        std::int32_t aux4 = 0;
        std::int32_t aux5 = 0;
        std::int32_t aux6 = 0;
        float aux7 = 0.0f;
        std::int32_t low_samples = 1;
        float duration = 1.0f;
        float interval_center = 0.5f;
        std::int32_t aux8 = 0;
        float bias = 0.0f;
        friend bool operator==(const MotionBlur&, const MotionBlur&) = default;
    };

    struct Gi {
        std::int32_t on = 0;
        std::int32_t refract_caustics = 1;
        std::int32_t reflect_caustics = 0;
        float saturation = 1.0f;
        float contrast = 1.0f;
        float contrast_base = 0.5f;
        std::uint32_t primary_engine = 0;
        float primary_multiplier = 1.0f;
        std::uint32_t secondary_engine = 2;
        float secondary_multiplier = 1.0f;
        std::int32_t subdivs = 8;
        std::int32_t depth = 3;
        std::int32_t save_maps_per_frame = 0;
        friend bool operator==(const Gi&, const Gi&) = default;
    };

    struct IrradianceMap {
        std::int32_t min_rate = -3;
        std::int32_t max_rate = 0;
        std::int32_t subdivs = 50;
        std::int32_t interp_samples = 20;
        std::int32_t calc_interp_samples = 15;
        float color_threshold = 0.3f;
        float normal_threshold = 0.1f;
        float distance_threshold = 0.1f;
        std::int32_t show_samples = 0;
        std::int32_t interpolation_mode = 1;
        std::uint32_t mode = 0;
        std::int32_t dont_delete = 1;
        std::int32_t randomize_samples = 1;
        std::int32_t show_calc_phase = 1;
        std::int32_t show_direct_light = 0;
        std::int32_t multipass = 1;
        std::int32_t auto_save = 0;
        std::string str1;
        std::int32_t lookup_mode = 3;
        std::int32_t check_sample_visibility = 0;
        std::int32_t aux1 = 0;
        std::string str2;
        std::int32_t detail_enhancement = 0;
        float detail_radius = 60.0f;
        float detail_subdivs_mult = 0.3f;
        std::uint32_t detail_scale = 0;
        std::int32_t interp_frames = 2;  // not stored
        std::int32_t multiple_views = 0; // not stored
        friend bool operator==(const IrradianceMap&, const IrradianceMap&) = default;
    };

    struct PhotonMap {
        std::int32_t bounces = 10;
        float search_distance = 20.0f;
        std::int32_t max_photons = 30;
        std::int32_t prefilter = 0;
        std::int32_t prefilter_samples = 10;
        std::uint32_t mode = 0;
        float multiplier = 1.0f;
        std::int32_t auto_search_distance = 1;
        std::int32_t convex_hull_estimate = 0;
        std::int32_t dont_delete = 1;
        std::int32_t auto_save = 0;
        std::string str1;
        float retrace_corners = 0.0f;
        std::int32_t retrace_bounces = 10;
        std::int32_t store_direct_light = 1;
        float max_density = 0.0f;
        std::string str2;
        std::int32_t show_calc_phase = 0; // not stored
        friend bool operator==(const PhotonMap&, const PhotonMap&) = default;
    };

    struct LightCache {
        std::uint32_t subdivs = 1000;
        float sample_size = 0.02f;
        std::uint32_t filter_type = 1;
        float filter_size = 0.06f;
        std::int32_t depth = 100;
        std::int32_t show_calc_phase = 1;
        std::int32_t store_direct_light = 1;
        std::uint32_t world_scale = 0;
        std::uint32_t mode = 0;
        std::string str1;
        std::int32_t dont_delete = 1;
        std::int32_t auto_save = 0;
        std::string str2;
        std::int32_t filter_samples = 5;
        std::int32_t prefilter = 0;
        std::int32_t prefilter_samples = 10;
        std::int32_t use_for_glossy_rays = 0;
        std::int32_t num_passes = 8;
        std::int32_t adaptive_sampling = 0;
        std::int32_t adaptive_dirs_only = 0;    // not stored
        std::int32_t min_paths_per_sample = 16; // not stored
        std::int32_t multiple_views = 0;        // not stored
        friend bool operator==(const LightCache&, const LightCache&) = default;
    };

    struct Caustics {
        std::int32_t on = 0;
        float search_distance = 1e18f;
        std::int32_t max_photons = 50;
        float multiplier = 1.0f;
        float max_density = 0.0f;
        std::uint32_t mode = 0;
        std::int32_t dont_delete = 1;
        std::int32_t auto_save = 0;
        std::string str1;
        std::string str2;
        std::int32_t show_calc_phase = 0; // not stored
        friend bool operator==(const Caustics&, const Caustics&) = default;
    };

    struct Raycaster {
        std::int32_t maxLevels = 60;
        float minLeafSize = 0.0f;
        float faceLevelCoef = 2.0f;
        std::uint32_t dynMemLimit = 400;
        std::int32_t optLevel = 0; // not stored
        friend bool operator==(const Raycaster&, const Raycaster&) = default;
    };

    struct RegionsGenerator {
        std::int32_t xc = 48;
        std::int32_t yc = 48;
        std::int32_t xymeans = 0;
        std::int32_t seqtype = 4;
        std::int32_t reverse = 0;
        std::uint32_t aux1 = 0;
        friend bool operator==(const RegionsGenerator&, const RegionsGenerator&) = default;
    };

    struct DmcSampler {
        std::int32_t time_dependent = 1;
        float aux1 = 1.0f;
        float adaptive_amount = 0.85f;
        float adaptive_threshold = 0.01f;
        std::int32_t adaptive_min_samples = 8;
        float subdivs_mult = 1.0f;
        std::int32_t path_sampler_type = 2;
        friend bool operator==(const DmcSampler&, const DmcSampler&) = default;
    };

    struct ColorMapping {
        std::int32_t type = 0;
        std::int32_t affect_background = 1;
        std::int32_t clamp_output = 0;
        std::int32_t subpixel_mapping = 0;
        float gamma = 1.0f;
        std::int32_t adaptation_only = 0; // not stored
        float clamp_level = 1.0f;         // not stored
        std::int32_t linearWorkflow = 0;  // not stored
        friend bool operator==(const ColorMapping&, const ColorMapping&) = default;
    };

    struct Options {
        std::int32_t geom_displacement = 1;
        std::int32_t geom_doHidden = 1; // not stored
        std::int32_t light_doLights = 1;
        std::int32_t light_doShadows = 1;
        std::int32_t light_doDefaultLights = 1;
        std::int32_t light_onlyGI = 0;
        std::int32_t light_doHiddenLights = 1;
        std::int32_t mtl_reflectionRefraction = 1;
        std::int32_t mtl_limitDepth = 0;
        std::int32_t mtl_maxDepth = 2;
        std::int32_t mtl_doMaps = 1;
        std::int32_t mtl_filterMaps = 1;
        std::int32_t mtl_filterMapsForSecondaryRays = 0; // not stored
        std::int32_t mtl_transpMaxLevels = 50;
        float mtl_transpCutoff = 0.001f;
        std::int32_t mtl_glossy = 1;
        std::int32_t gi_dontRenderImage = 0;
        std::int32_t mtl_override_on = 0;
        float ray_bias = 0.0f;
        std::int32_t aux1 = 1;
        std::int32_t misc_lowThreadPriority = 0;
        std::int32_t geom_backfaceCull = 0; // not stored
        friend bool operator==(const Options&, const Options&) = default;
    };

    struct DefaultDisplacement {
        std::int32_t override_on = 1;
        float edgeLength = 4.0f;
        std::int32_t viewDependent = 1;
        std::int32_t maxSubdivs = 256;
        std::int32_t tightBounds = 1;
        float amount = 1.0f;
        std::int32_t relative = 0;
        std::int32_t aux1 = 0;
        std::int32_t aux2 = 16;
        friend bool operator==(const DefaultDisplacement&, const DefaultDisplacement&) = default;
    };

    ImageFilter imageFilter;
    ImageSampler imageSampler;
    Camera camera;
    CameraDof cameraDof;
    MotionBlur motionBlur;
    Gi gi;
    IrradianceMap irradianceMap;
    PhotonMap photonMap;
    LightCache lightCache;
    Caustics caustics;
    Raycaster raycaster;
    RegionsGenerator regionsGenerator;
    DmcSampler dmcSampler;
    ColorMapping colorMapping;
    Options options;
    DefaultDisplacement defaultDisplacement;

    // Every field equal, stored or not (exact float comparison).
    friend bool operator==(const KavorParams&, const KavorParams&) = default;
};

} // namespace KavorUtils
