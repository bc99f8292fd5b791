#include <dexmor/options/OrvexParams.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/RecordEncodings.hpp"

#include <array>

namespace OrvexKavorCore {

namespace {

using P = KavorUtils::KavorParams;

namespace enc = record::enc;
using record::since;

// The parameter block's record, in archive order after its VersionWord(0, V).
// A record of version V holds the rows whose "since" is at most V. The comment
// is the row number of the stored field. Text is a WString whose empty value
// leaves the field as it was (enc::TextOrKeep).
constexpr std::array kFields{
    record::fieldAs<enc::Int32, &P::imageFilter, &P::ImageFilter::on>("imageFilter.on", since(1)), // 1
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::type>("imageSampler.type", since(1)), // 2
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::fixed_subdivs>("imageSampler.fixed_subdivs", since(1)), // 3
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::dmc_minSubdivs>("imageSampler.dmc_minSubdivs", since(1)), // 4
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::dmc_maxSubdivs>("imageSampler.dmc_maxSubdivs", since(1)), // 5
    record::fieldAs<enc::Float32, &P::imageSampler, &P::ImageSampler::dmc_threshold>("imageSampler.dmc_threshold", since(1)), // 6
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::subdivision_minRate>("imageSampler.subdivision_minRate", since(1)), // 7
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::subdivision_maxRate>("imageSampler.subdivision_maxRate", since(1)), // 8
    record::fieldAs<enc::Float32, &P::imageSampler, &P::ImageSampler::subdivision_threshold>("imageSampler.subdivision_threshold", since(1)), // 9
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::subdivision_jitter>("imageSampler.subdivision_jitter", since(1)), // 10
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::subdivision_edges>("imageSampler.subdivision_edges", since(1)), // 11
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::aux1>("imageSampler.aux1", since(1)), // 12
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::subdivision_normals>("imageSampler.subdivision_normals", since(1)), // 13
    record::fieldAs<enc::Float32, &P::imageSampler, &P::ImageSampler::subdivision_normals_threshold>("imageSampler.subdivision_normals_threshold", since(1)), // 14
    record::fieldAs<enc::Int32, &P::imageSampler, &P::ImageSampler::aux2>("imageSampler.aux2", since(1)), // 15
    record::fieldAs<enc::Float32, &P::imageSampler, &P::ImageSampler::aux3>("imageSampler.aux3", since(1)), // 16
    record::fieldAs<enc::Int32, &P::camera, &P::Camera::type>("camera.type", since(1)), // 17
    record::fieldAs<enc::Int32, &P::cameraDof, &P::CameraDof::on>("cameraDof.on", since(1)), // 18
    record::fieldAs<enc::Int32, &P::cameraDof, &P::CameraDof::subdivs>("cameraDof.subdivs", since(1)), // 19
    record::fieldAs<enc::Float32, &P::cameraDof, &P::CameraDof::center_bias>("cameraDof.center_bias", since(1)), // 20
    record::fieldAs<enc::Int32, &P::cameraDof, &P::CameraDof::sides_on>("cameraDof.sides_on", since(1)), // 21
    record::fieldAs<enc::Int32, &P::cameraDof, &P::CameraDof::sides_num>("cameraDof.sides_num", since(1)), // 22
    record::fieldAs<enc::Float32, &P::cameraDof, &P::CameraDof::anisotropy>("cameraDof.anisotropy", since(1)), // 23
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::on>("motionBlur.on", since(1)), // 24
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::geom_samples>("motionBlur.geom_samples", since(1)), // 25
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux1>("motionBlur.aux1", since(1)), // 26
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux2>("motionBlur.aux2", since(1)), // 27
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::subdivs>("motionBlur.subdivs", since(1)), // 28
    record::fieldAs<enc::Float32, &P::motionBlur, &P::MotionBlur::aux3>("motionBlur.aux3", since(1)), // 29
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux4>("motionBlur.aux4", since(1)), // 30
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux5>("motionBlur.aux5", since(1)), // 31
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux6>("motionBlur.aux6", since(1)), // 32
    record::fieldAs<enc::Float32, &P::motionBlur, &P::MotionBlur::aux7>("motionBlur.aux7", since(1)), // 33
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::low_samples>("motionBlur.low_samples", since(1)), // 34
    record::fieldAs<enc::Float32, &P::motionBlur, &P::MotionBlur::duration>("motionBlur.duration", since(1)), // 35
    record::fieldAs<enc::Float32, &P::motionBlur, &P::MotionBlur::interval_center>("motionBlur.interval_center", since(1)), // 36
    record::fieldAs<enc::Int32, &P::motionBlur, &P::MotionBlur::aux8>("motionBlur.aux8", since(1)), // 37
    record::fieldAs<enc::Float32, &P::motionBlur, &P::MotionBlur::bias>("motionBlur.bias", since(1)), // 38
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::on>("gi.on", since(1)), // 39
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::refract_caustics>("gi.refract_caustics", since(1)), // 40
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::reflect_caustics>("gi.reflect_caustics", since(1)), // 41
    record::fieldAs<enc::Float32, &P::gi, &P::Gi::saturation>("gi.saturation", since(1)), // 42
    record::fieldAs<enc::Float32, &P::gi, &P::Gi::contrast>("gi.contrast", since(1)), // 43
    record::fieldAs<enc::Float32, &P::gi, &P::Gi::contrast_base>("gi.contrast_base", since(1)), // 44
    record::fieldAs<enc::UInt32, &P::gi, &P::Gi::primary_engine>("gi.primary_engine", since(1)), // 45
    record::fieldAs<enc::Float32, &P::gi, &P::Gi::primary_multiplier>("gi.primary_multiplier", since(1)), // 46
    record::fieldAs<enc::UInt32, &P::gi, &P::Gi::secondary_engine>("gi.secondary_engine", since(1)), // 47
    record::fieldAs<enc::Float32, &P::gi, &P::Gi::secondary_multiplier>("gi.secondary_multiplier", since(1)), // 48
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::subdivs>("gi.subdivs", since(1)), // 49
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::depth>("gi.depth", since(1)), // 50
    record::fieldAs<enc::Int32, &P::gi, &P::Gi::save_maps_per_frame>("gi.save_maps_per_frame", since(1)), // 51
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::min_rate>("irradianceMap.min_rate", since(1)), // 52
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::max_rate>("irradianceMap.max_rate", since(1)), // 53
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::subdivs>("irradianceMap.subdivs", since(1)), // 54
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::interp_samples>("irradianceMap.interp_samples", since(1)), // 55
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::calc_interp_samples>("irradianceMap.calc_interp_samples", since(1)), // 56
    record::fieldAs<enc::Float32, &P::irradianceMap, &P::IrradianceMap::color_threshold>("irradianceMap.color_threshold", since(1)), // 57
    record::fieldAs<enc::Float32, &P::irradianceMap, &P::IrradianceMap::normal_threshold>("irradianceMap.normal_threshold", since(1)), // 58
    record::fieldAs<enc::Float32, &P::irradianceMap, &P::IrradianceMap::distance_threshold>("irradianceMap.distance_threshold", since(1)), // 59
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::show_samples>("irradianceMap.show_samples", since(1)), // 60
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::interpolation_mode>("irradianceMap.interpolation_mode", since(1)), // 61
    record::fieldAs<enc::UInt32, &P::irradianceMap, &P::IrradianceMap::mode>("irradianceMap.mode", since(1)), // 62
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::dont_delete>("irradianceMap.dont_delete", since(1)), // 63
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::randomize_samples>("irradianceMap.randomize_samples", since(1)), // 64
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::show_calc_phase>("irradianceMap.show_calc_phase", since(1)), // 65
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::show_direct_light>("irradianceMap.show_direct_light", since(1)), // 66
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::multipass>("irradianceMap.multipass", since(1)), // 67
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::auto_save>("irradianceMap.auto_save", since(1)), // 68
    record::fieldAs<enc::TextOrKeep, &P::irradianceMap, &P::IrradianceMap::str1>("irradianceMap.str1", since(1)), // 69
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::lookup_mode>("irradianceMap.lookup_mode", since(1)), // 70
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::check_sample_visibility>("irradianceMap.check_sample_visibility", since(1)), // 71
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::aux1>("irradianceMap.aux1", since(1)), // 72
    record::fieldAs<enc::TextOrKeep, &P::irradianceMap, &P::IrradianceMap::str2>("irradianceMap.str2", since(1)), // 73
    // Versions 1 to 4 hold one Float32 in place of rows 74 to 77; it is read and dropped.
    record::discarded<P, float>("irradianceMap.detail (versions 1-4)", record::between(1, 4)),
    record::fieldAs<enc::Int32, &P::irradianceMap, &P::IrradianceMap::detail_enhancement>("irradianceMap.detail_enhancement", since(5)), // 74
    record::fieldAs<enc::Float32, &P::irradianceMap, &P::IrradianceMap::detail_radius>("irradianceMap.detail_radius", since(5)), // 75
    record::fieldAs<enc::Float32, &P::irradianceMap, &P::IrradianceMap::detail_subdivs_mult>("irradianceMap.detail_subdivs_mult", since(5)), // 76
    record::fieldAs<enc::UInt32, &P::irradianceMap, &P::IrradianceMap::detail_scale>("irradianceMap.detail_scale", since(5)), // 77
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::bounces>("photonMap.bounces", since(1)), // 78
    record::fieldAs<enc::Float32, &P::photonMap, &P::PhotonMap::search_distance>("photonMap.search_distance", since(1)), // 79
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::max_photons>("photonMap.max_photons", since(1)), // 80
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::prefilter>("photonMap.prefilter", since(1)), // 81
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::prefilter_samples>("photonMap.prefilter_samples", since(1)), // 82
    record::fieldAs<enc::UInt32, &P::photonMap, &P::PhotonMap::mode>("photonMap.mode", since(1)), // 83
    record::fieldAs<enc::Float32, &P::photonMap, &P::PhotonMap::multiplier>("photonMap.multiplier", since(1)), // 84
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::auto_search_distance>("photonMap.auto_search_distance", since(1)), // 85
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::convex_hull_estimate>("photonMap.convex_hull_estimate", since(1)), // 86
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::dont_delete>("photonMap.dont_delete", since(1)), // 87
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::auto_save>("photonMap.auto_save", since(1)), // 88
    record::fieldAs<enc::TextOrKeep, &P::photonMap, &P::PhotonMap::str1>("photonMap.str1", since(1)), // 89
    record::fieldAs<enc::Float32, &P::photonMap, &P::PhotonMap::retrace_corners>("photonMap.retrace_corners", since(1)), // 90
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::retrace_bounces>("photonMap.retrace_bounces", since(1)), // 91
    record::fieldAs<enc::Int32, &P::photonMap, &P::PhotonMap::store_direct_light>("photonMap.store_direct_light", since(1)), // 92
    record::fieldAs<enc::Float32, &P::photonMap, &P::PhotonMap::max_density>("photonMap.max_density", since(1)), // 93
    record::fieldAs<enc::TextOrKeep, &P::photonMap, &P::PhotonMap::str2>("photonMap.str2", since(1)), // 94
    record::fieldAs<enc::UInt32, &P::lightCache, &P::LightCache::subdivs>("lightCache.subdivs", since(1)), // 95
    record::fieldAs<enc::Float32, &P::lightCache, &P::LightCache::sample_size>("lightCache.sample_size", since(1)), // 96
    record::fieldAs<enc::UInt32, &P::lightCache, &P::LightCache::filter_type>("lightCache.filter_type", since(1)), // 97
    record::fieldAs<enc::Float32, &P::lightCache, &P::LightCache::filter_size>("lightCache.filter_size", since(1)), // 98
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::depth>("lightCache.depth", since(1)), // 99
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::show_calc_phase>("lightCache.show_calc_phase", since(1)), // 100
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::store_direct_light>("lightCache.store_direct_light", since(1)), // 101
    record::fieldAs<enc::UInt32, &P::lightCache, &P::LightCache::world_scale>("lightCache.world_scale", since(1)), // 102
    record::fieldAs<enc::UInt32, &P::lightCache, &P::LightCache::mode>("lightCache.mode", since(1)), // 103
    record::fieldAs<enc::TextOrKeep, &P::lightCache, &P::LightCache::str1>("lightCache.str1", since(1)), // 104
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::dont_delete>("lightCache.dont_delete", since(1)), // 105
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::auto_save>("lightCache.auto_save", since(1)), // 106
    record::fieldAs<enc::TextOrKeep, &P::lightCache, &P::LightCache::str2>("lightCache.str2", since(1)), // 107
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::filter_samples>("lightCache.filter_samples", since(1)), // 108
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::prefilter>("lightCache.prefilter", since(1)), // 109
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::prefilter_samples>("lightCache.prefilter_samples", since(1)), // 110
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::use_for_glossy_rays>("lightCache.use_for_glossy_rays", since(1)), // 111
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::num_passes>("lightCache.num_passes", since(1)), // 112
    record::fieldAs<enc::Int32, &P::lightCache, &P::LightCache::adaptive_sampling>("lightCache.adaptive_sampling", since(1)), // 113
    record::fieldAs<enc::Int32, &P::caustics, &P::Caustics::on>("caustics.on", since(1)), // 114
    record::fieldAs<enc::Float32, &P::caustics, &P::Caustics::search_distance>("caustics.search_distance", since(1)), // 115
    record::fieldAs<enc::Int32, &P::caustics, &P::Caustics::max_photons>("caustics.max_photons", since(1)), // 116
    record::fieldAs<enc::Float32, &P::caustics, &P::Caustics::multiplier>("caustics.multiplier", since(1)), // 117
    record::fieldAs<enc::Float32, &P::caustics, &P::Caustics::max_density>("caustics.max_density", since(1)), // 118
    record::fieldAs<enc::UInt32, &P::caustics, &P::Caustics::mode>("caustics.mode", since(1)), // 119
    record::fieldAs<enc::Int32, &P::caustics, &P::Caustics::dont_delete>("caustics.dont_delete", since(1)), // 120
    record::fieldAs<enc::Int32, &P::caustics, &P::Caustics::auto_save>("caustics.auto_save", since(1)), // 121
    record::fieldAs<enc::TextOrKeep, &P::caustics, &P::Caustics::str1>("caustics.str1", since(1)), // 122
    record::fieldAs<enc::TextOrKeep, &P::caustics, &P::Caustics::str2>("caustics.str2", since(1)), // 123
    record::fieldAs<enc::Int32, &P::raycaster, &P::Raycaster::maxLevels>("raycaster.maxLevels", since(1)), // 124
    record::fieldAs<enc::Float32, &P::raycaster, &P::Raycaster::minLeafSize>("raycaster.minLeafSize", since(1)), // 125
    record::fieldAs<enc::Float32, &P::raycaster, &P::Raycaster::faceLevelCoef>("raycaster.faceLevelCoef", since(1)), // 126
    record::fieldAs<enc::UInt32, &P::raycaster, &P::Raycaster::dynMemLimit>("raycaster.dynMemLimit", since(1)), // 127
    record::fieldAs<enc::Int32, &P::regionsGenerator, &P::RegionsGenerator::xc>("regionsGenerator.xc", since(1)), // 128
    record::fieldAs<enc::Int32, &P::regionsGenerator, &P::RegionsGenerator::yc>("regionsGenerator.yc", since(1)), // 129
    record::fieldAs<enc::Int32, &P::regionsGenerator, &P::RegionsGenerator::xymeans>("regionsGenerator.xymeans", since(1)), // 130
    record::fieldAs<enc::Int32, &P::regionsGenerator, &P::RegionsGenerator::seqtype>("regionsGenerator.seqtype", since(1)), // 131
    record::fieldAs<enc::Int32, &P::regionsGenerator, &P::RegionsGenerator::reverse>("regionsGenerator.reverse", since(1)), // 132
    record::fieldAs<enc::UInt32, &P::regionsGenerator, &P::RegionsGenerator::aux1>("regionsGenerator.aux1", since(1)), // 133
    record::fieldAs<enc::Int32, &P::dmcSampler, &P::DmcSampler::time_dependent>("dmcSampler.time_dependent", since(1)), // 134
    record::fieldAs<enc::Float32, &P::dmcSampler, &P::DmcSampler::aux1>("dmcSampler.aux1", since(1)), // 135
    record::fieldAs<enc::Float32, &P::dmcSampler, &P::DmcSampler::adaptive_amount>("dmcSampler.adaptive_amount", since(1)), // 136
    record::fieldAs<enc::Float32, &P::dmcSampler, &P::DmcSampler::adaptive_threshold>("dmcSampler.adaptive_threshold", since(1)), // 137
    record::fieldAs<enc::Int32, &P::dmcSampler, &P::DmcSampler::adaptive_min_samples>("dmcSampler.adaptive_min_samples", since(1)), // 138
    record::fieldAs<enc::Float32, &P::dmcSampler, &P::DmcSampler::subdivs_mult>("dmcSampler.subdivs_mult", since(1)), // 139
    record::fieldAs<enc::Int32, &P::dmcSampler, &P::DmcSampler::path_sampler_type>("dmcSampler.path_sampler_type", since(2)), // 140
    record::fieldAs<enc::Int32, &P::colorMapping, &P::ColorMapping::type>("colorMapping.type", since(1)), // 141
    record::fieldAs<enc::Int32, &P::colorMapping, &P::ColorMapping::affect_background>("colorMapping.affect_background", since(1)), // 142
    record::fieldAs<enc::Int32, &P::colorMapping, &P::ColorMapping::clamp_output>("colorMapping.clamp_output", since(1)), // 143
    record::fieldAs<enc::Int32, &P::colorMapping, &P::ColorMapping::subpixel_mapping>("colorMapping.subpixel_mapping", since(3)), // 144
    record::fieldAs<enc::Float32, &P::colorMapping, &P::ColorMapping::gamma>("colorMapping.gamma", since(4)), // 145
    record::fieldAs<enc::Int32, &P::options, &P::Options::geom_displacement>("options.geom_displacement", since(1)), // 146
    record::fieldAs<enc::Int32, &P::options, &P::Options::light_doLights>("options.light_doLights", since(1)), // 147
    record::fieldAs<enc::Int32, &P::options, &P::Options::light_doShadows>("options.light_doShadows", since(1)), // 148
    record::fieldAs<enc::Int32, &P::options, &P::Options::light_doDefaultLights>("options.light_doDefaultLights", since(1)), // 149
    record::fieldAs<enc::Int32, &P::options, &P::Options::light_onlyGI>("options.light_onlyGI", since(1)), // 150
    record::fieldAs<enc::Int32, &P::options, &P::Options::light_doHiddenLights>("options.light_doHiddenLights", since(1)), // 151
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_reflectionRefraction>("options.mtl_reflectionRefraction", since(1)), // 152
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_limitDepth>("options.mtl_limitDepth", since(1)), // 153
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_maxDepth>("options.mtl_maxDepth", since(1)), // 154
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_doMaps>("options.mtl_doMaps", since(1)), // 155
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_filterMaps>("options.mtl_filterMaps", since(1)), // 156
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_transpMaxLevels>("options.mtl_transpMaxLevels", since(1)), // 157
    record::fieldAs<enc::Float32, &P::options, &P::Options::mtl_transpCutoff>("options.mtl_transpCutoff", since(1)), // 158
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_glossy>("options.mtl_glossy", since(1)), // 159
    record::fieldAs<enc::Int32, &P::options, &P::Options::gi_dontRenderImage>("options.gi_dontRenderImage", since(1)), // 160
    record::fieldAs<enc::Int32, &P::options, &P::Options::mtl_override_on>("options.mtl_override_on", since(1)), // 161
    record::fieldAs<enc::Float32, &P::options, &P::Options::ray_bias>("options.ray_bias", since(1)), // 162
    record::fieldAs<enc::Int32, &P::options, &P::Options::aux1>("options.aux1", since(1)), // 163
    record::fieldAs<enc::Int32, &P::options, &P::Options::misc_lowThreadPriority>("options.misc_lowThreadPriority", since(1)), // 164
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::override_on>("defaultDisplacement.override_on", since(1)), // 165
    record::fieldAs<enc::Float32, &P::defaultDisplacement, &P::DefaultDisplacement::edgeLength>("defaultDisplacement.edgeLength", since(1)), // 166
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::viewDependent>("defaultDisplacement.viewDependent", since(1)), // 167
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::maxSubdivs>("defaultDisplacement.maxSubdivs", since(1)), // 168
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::tightBounds>("defaultDisplacement.tightBounds", since(1)), // 169
    record::fieldAs<enc::Float32, &P::defaultDisplacement, &P::DefaultDisplacement::amount>("defaultDisplacement.amount", since(1)), // 170
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::relative>("defaultDisplacement.relative", since(1)), // 171
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::aux1>("defaultDisplacement.aux1", since(1)), // 172
    record::fieldAs<enc::Int32, &P::defaultDisplacement, &P::DefaultDisplacement::aux2>("defaultDisplacement.aux2", since(1)), // 173
};


static_assert(record::enc::countHeld(kFields, 5) == 173, "a version-5 record holds 173 fields");
static_assert(record::enc::countHeld(kFields, 1) == 167, "a version-1 record holds 166 fields and one dropped value");

} // namespace

bool OrvexParams::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    return record::writeFields(ar, static_cast<P&>(*this), kFields, kVersion);
}

bool OrvexParams::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (!ar.checkVersion(version, kVersion, "parameter block")) return false;
    return record::readFields(ar, static_cast<P&>(*this), kFields, version.second());
}

void OrvexParams::resetToDefaults() { static_cast<P&>(*this) = P{}; }

void OrvexParams::applyOptionsSetOverrides() {
    imageFilter.on = 1;
    imageSampler.type = 2;
    options.mtl_limitDepth = 1;
    options.mtl_maxDepth = 2;
    caustics.search_distance = 20.0f;
    dmcSampler.adaptive_threshold = 0.01f;
    lightCache.str1.clear();
    lightCache.str2.clear();
    lightCache.adaptive_sampling = 0;
}

bool OrvexParams::isEqual(const OrvexParams& other) const {
    return record::fieldsEqual<P>(*this, other, kFields);
}

const char* OrvexParams::firstDifference(const OrvexParams& other) const {
    return record::firstDifference<P>(*this, other, kFields);
}

std::span<const record::Field<KavorUtils::KavorParams>> OrvexParams::recordFields() { return kFields; }

} // namespace OrvexKavorCore
