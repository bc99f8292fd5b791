#include <dexmor/options/OrvexParams.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/RecordEncodings.hpp"

#include <array>

namespace OrvexKavorCore {

namespace {

using P = KavorUtils::KavorParams;

// One stored field: group.name with its encoding, present from record version
// `first` on. The row's name is the field's path, as failure reports show it.
#define ROW(group, name, encoding, first)                                                                   \
    record::fieldAs<record::enc::encoding, &P::group, &decltype(P::group)::name>(#group "." #name,          \
                                                                                  record::since(first))

// The parameter block's record, in archive order after its VersionWord(0, V).
// A record of version V holds the rows whose "since" is at most V. The comment
// is the row number of the stored field. Text is a WString whose empty value
// leaves the field as it was (enc::TextOrKeep).
constexpr std::array kFields{
    // group                 field                          encoding    since   #
    ROW(imageFilter,         on,                            Int32,      1), // 1
    ROW(imageSampler,        type,                          Int32,      1), // 2
    ROW(imageSampler,        fixed_subdivs,                 Int32,      1), // 3
    ROW(imageSampler,        dmc_minSubdivs,                Int32,      1), // 4
    ROW(imageSampler,        dmc_maxSubdivs,                Int32,      1), // 5
    ROW(imageSampler,        dmc_threshold,                 Float32,    1), // 6
    ROW(imageSampler,        subdivision_minRate,           Int32,      1), // 7
    ROW(imageSampler,        subdivision_maxRate,           Int32,      1), // 8
    ROW(imageSampler,        subdivision_threshold,         Float32,    1), // 9
    ROW(imageSampler,        subdivision_jitter,            Int32,      1), // 10
    ROW(imageSampler,        subdivision_edges,             Int32,      1), // 11
    ROW(imageSampler,        aux1,                          Int32,      1), // 12
    ROW(imageSampler,        subdivision_normals,           Int32,      1), // 13
    ROW(imageSampler,        subdivision_normals_threshold, Float32,    1), // 14
    ROW(imageSampler,        aux2,                          Int32,      1), // 15
    ROW(imageSampler,        aux3,                          Float32,    1), // 16
    ROW(camera,              type,                          Int32,      1), // 17
    ROW(cameraDof,           on,                            Int32,      1), // 18
    ROW(cameraDof,           subdivs,                       Int32,      1), // 19
    ROW(cameraDof,           center_bias,                   Float32,    1), // 20
    ROW(cameraDof,           sides_on,                      Int32,      1), // 21
    ROW(cameraDof,           sides_num,                     Int32,      1), // 22
    ROW(cameraDof,           anisotropy,                    Float32,    1), // 23
    ROW(motionBlur,          on,                            Int32,      1), // 24
    ROW(motionBlur,          geom_samples,                  Int32,      1), // 25
    ROW(motionBlur,          aux1,                          Int32,      1), // 26
    ROW(motionBlur,          aux2,                          Int32,      1), // 27
    ROW(motionBlur,          subdivs,                       Int32,      1), // 28
    ROW(motionBlur,          aux3,                          Float32,    1), // 29
    ROW(motionBlur,          aux4,                          Int32,      1), // 30
    ROW(motionBlur,          aux5,                          Int32,      1), // 31
    ROW(motionBlur,          aux6,                          Int32,      1), // 32
    ROW(motionBlur,          aux7,                          Float32,    1), // 33
    ROW(motionBlur,          low_samples,                   Int32,      1), // 34
    ROW(motionBlur,          duration,                      Float32,    1), // 35
    ROW(motionBlur,          interval_center,               Float32,    1), // 36
    ROW(motionBlur,          aux8,                          Int32,      1), // 37
    ROW(motionBlur,          bias,                          Float32,    1), // 38
    ROW(gi,                  on,                            Int32,      1), // 39
    ROW(gi,                  refract_caustics,              Int32,      1), // 40
    ROW(gi,                  reflect_caustics,              Int32,      1), // 41
    ROW(gi,                  saturation,                    Float32,    1), // 42
    ROW(gi,                  contrast,                      Float32,    1), // 43
    ROW(gi,                  contrast_base,                 Float32,    1), // 44
    ROW(gi,                  primary_engine,                UInt32,     1), // 45
    ROW(gi,                  primary_multiplier,            Float32,    1), // 46
    ROW(gi,                  secondary_engine,              UInt32,     1), // 47
    ROW(gi,                  secondary_multiplier,          Float32,    1), // 48
    ROW(gi,                  subdivs,                       Int32,      1), // 49
    ROW(gi,                  depth,                         Int32,      1), // 50
    ROW(gi,                  save_maps_per_frame,           Int32,      1), // 51
    ROW(irradianceMap,       min_rate,                      Int32,      1), // 52
    ROW(irradianceMap,       max_rate,                      Int32,      1), // 53
    ROW(irradianceMap,       subdivs,                       Int32,      1), // 54
    ROW(irradianceMap,       interp_samples,                Int32,      1), // 55
    ROW(irradianceMap,       calc_interp_samples,           Int32,      1), // 56
    ROW(irradianceMap,       color_threshold,               Float32,    1), // 57
    ROW(irradianceMap,       normal_threshold,              Float32,    1), // 58
    ROW(irradianceMap,       distance_threshold,            Float32,    1), // 59
    ROW(irradianceMap,       show_samples,                  Int32,      1), // 60
    ROW(irradianceMap,       interpolation_mode,            Int32,      1), // 61
    ROW(irradianceMap,       mode,                          UInt32,     1), // 62
    ROW(irradianceMap,       dont_delete,                   Int32,      1), // 63
    ROW(irradianceMap,       randomize_samples,             Int32,      1), // 64
    ROW(irradianceMap,       show_calc_phase,               Int32,      1), // 65
    ROW(irradianceMap,       show_direct_light,             Int32,      1), // 66
    ROW(irradianceMap,       multipass,                     Int32,      1), // 67
    ROW(irradianceMap,       auto_save,                     Int32,      1), // 68
    ROW(irradianceMap,       str1,                          TextOrKeep, 1), // 69
    ROW(irradianceMap,       lookup_mode,                   Int32,      1), // 70
    ROW(irradianceMap,       check_sample_visibility,       Int32,      1), // 71
    ROW(irradianceMap,       aux1,                          Int32,      1), // 72
    ROW(irradianceMap,       str2,                          TextOrKeep, 1), // 73
    // Versions 1 to 4 hold one Float32 in place of rows 74 to 77; it is read and dropped.
    record::discarded<P, float>("irradianceMap.detail (versions 1-4)", record::between(1, 4)),
    ROW(irradianceMap,       detail_enhancement,            Int32,      5), // 74
    ROW(irradianceMap,       detail_radius,                 Float32,    5), // 75
    ROW(irradianceMap,       detail_subdivs_mult,           Float32,    5), // 76
    ROW(irradianceMap,       detail_scale,                  UInt32,     5), // 77
    ROW(photonMap,           bounces,                       Int32,      1), // 78
    ROW(photonMap,           search_distance,               Float32,    1), // 79
    ROW(photonMap,           max_photons,                   Int32,      1), // 80
    ROW(photonMap,           prefilter,                     Int32,      1), // 81
    ROW(photonMap,           prefilter_samples,             Int32,      1), // 82
    ROW(photonMap,           mode,                          UInt32,     1), // 83
    ROW(photonMap,           multiplier,                    Float32,    1), // 84
    ROW(photonMap,           auto_search_distance,          Int32,      1), // 85
    ROW(photonMap,           convex_hull_estimate,          Int32,      1), // 86
    ROW(photonMap,           dont_delete,                   Int32,      1), // 87
    ROW(photonMap,           auto_save,                     Int32,      1), // 88
    ROW(photonMap,           str1,                          TextOrKeep, 1), // 89
    ROW(photonMap,           retrace_corners,               Float32,    1), // 90
    ROW(photonMap,           retrace_bounces,               Int32,      1), // 91
    ROW(photonMap,           store_direct_light,            Int32,      1), // 92
    ROW(photonMap,           max_density,                   Float32,    1), // 93
    ROW(photonMap,           str2,                          TextOrKeep, 1), // 94
    ROW(lightCache,          subdivs,                       UInt32,     1), // 95
    ROW(lightCache,          sample_size,                   Float32,    1), // 96
    ROW(lightCache,          filter_type,                   UInt32,     1), // 97
    ROW(lightCache,          filter_size,                   Float32,    1), // 98
    ROW(lightCache,          depth,                         Int32,      1), // 99
    ROW(lightCache,          show_calc_phase,               Int32,      1), // 100
    ROW(lightCache,          store_direct_light,            Int32,      1), // 101
    ROW(lightCache,          world_scale,                   UInt32,     1), // 102
    ROW(lightCache,          mode,                          UInt32,     1), // 103
    ROW(lightCache,          str1,                          TextOrKeep, 1), // 104
    ROW(lightCache,          dont_delete,                   Int32,      1), // 105
    ROW(lightCache,          auto_save,                     Int32,      1), // 106
    ROW(lightCache,          str2,                          TextOrKeep, 1), // 107
    ROW(lightCache,          filter_samples,                Int32,      1), // 108
    ROW(lightCache,          prefilter,                     Int32,      1), // 109
    ROW(lightCache,          prefilter_samples,             Int32,      1), // 110
    ROW(lightCache,          use_for_glossy_rays,           Int32,      1), // 111
    ROW(lightCache,          num_passes,                    Int32,      1), // 112
    ROW(lightCache,          adaptive_sampling,             Int32,      1), // 113
    ROW(caustics,            on,                            Int32,      1), // 114
    ROW(caustics,            search_distance,               Float32,    1), // 115
    ROW(caustics,            max_photons,                   Int32,      1), // 116
    ROW(caustics,            multiplier,                    Float32,    1), // 117
    ROW(caustics,            max_density,                   Float32,    1), // 118
    ROW(caustics,            mode,                          UInt32,     1), // 119
    ROW(caustics,            dont_delete,                   Int32,      1), // 120
    ROW(caustics,            auto_save,                     Int32,      1), // 121
    ROW(caustics,            str1,                          TextOrKeep, 1), // 122
    ROW(caustics,            str2,                          TextOrKeep, 1), // 123
    ROW(raycaster,           maxLevels,                     Int32,      1), // 124
    ROW(raycaster,           minLeafSize,                   Float32,    1), // 125
    ROW(raycaster,           faceLevelCoef,                 Float32,    1), // 126
    ROW(raycaster,           dynMemLimit,                   UInt32,     1), // 127
    ROW(regionsGenerator,    xc,                            Int32,      1), // 128
    ROW(regionsGenerator,    yc,                            Int32,      1), // 129
    ROW(regionsGenerator,    xymeans,                       Int32,      1), // 130
    ROW(regionsGenerator,    seqtype,                       Int32,      1), // 131
    ROW(regionsGenerator,    reverse,                       Int32,      1), // 132
    ROW(regionsGenerator,    aux1,                          UInt32,     1), // 133
    ROW(dmcSampler,          time_dependent,                Int32,      1), // 134
    ROW(dmcSampler,          aux1,                          Float32,    1), // 135
    ROW(dmcSampler,          adaptive_amount,               Float32,    1), // 136
    ROW(dmcSampler,          adaptive_threshold,            Float32,    1), // 137
    ROW(dmcSampler,          adaptive_min_samples,          Int32,      1), // 138
    ROW(dmcSampler,          subdivs_mult,                  Float32,    1), // 139
    ROW(dmcSampler,          path_sampler_type,             Int32,      2), // 140
    ROW(colorMapping,        type,                          Int32,      1), // 141
    ROW(colorMapping,        affect_background,             Int32,      1), // 142
    ROW(colorMapping,        clamp_output,                  Int32,      1), // 143
    ROW(colorMapping,        subpixel_mapping,              Int32,      3), // 144
    ROW(colorMapping,        gamma,                         Float32,    4), // 145
    ROW(options,             geom_displacement,             Int32,      1), // 146
    ROW(options,             light_doLights,                Int32,      1), // 147
    ROW(options,             light_doShadows,               Int32,      1), // 148
    ROW(options,             light_doDefaultLights,         Int32,      1), // 149
    ROW(options,             light_onlyGI,                  Int32,      1), // 150
    ROW(options,             light_doHiddenLights,          Int32,      1), // 151
    ROW(options,             mtl_reflectionRefraction,      Int32,      1), // 152
    ROW(options,             mtl_limitDepth,                Int32,      1), // 153
    ROW(options,             mtl_maxDepth,                  Int32,      1), // 154
    ROW(options,             mtl_doMaps,                    Int32,      1), // 155
    ROW(options,             mtl_filterMaps,                Int32,      1), // 156
    ROW(options,             mtl_transpMaxLevels,           Int32,      1), // 157
    ROW(options,             mtl_transpCutoff,              Float32,    1), // 158
    ROW(options,             mtl_glossy,                    Int32,      1), // 159
    ROW(options,             gi_dontRenderImage,            Int32,      1), // 160
    ROW(options,             mtl_override_on,               Int32,      1), // 161
    ROW(options,             ray_bias,                      Float32,    1), // 162
    ROW(options,             aux1,                          Int32,      1), // 163
    ROW(options,             misc_lowThreadPriority,        Int32,      1), // 164
    ROW(defaultDisplacement, override_on,                   Int32,      1), // 165
    ROW(defaultDisplacement, edgeLength,                    Float32,    1), // 166
    ROW(defaultDisplacement, viewDependent,                 Int32,      1), // 167
    ROW(defaultDisplacement, maxSubdivs,                    Int32,      1), // 168
    ROW(defaultDisplacement, tightBounds,                   Int32,      1), // 169
    ROW(defaultDisplacement, amount,                        Float32,    1), // 170
    ROW(defaultDisplacement, relative,                      Int32,      1), // 171
    ROW(defaultDisplacement, aux1,                          Int32,      1), // 172
    ROW(defaultDisplacement, aux2,                          Int32,      1), // 173
};

#undef ROW

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
    if (version.first() != 0 || version.second() < 1 || version.second() > kVersion)
        return ar.fail("unknown parameter block version (" + std::to_string(version.first()) + ", " +
                       std::to_string(version.second()) + ")");
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
