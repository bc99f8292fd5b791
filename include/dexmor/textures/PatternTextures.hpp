#pragma once
// Procedural patterns laid out by a UVW generator: UVWTexture, NoiseTexture,
// CheckerTexture, GridTexture, ClothTexture, BulgeTexture, RampTexture.
//
// Records, after the VersionWord (0, version). "member" is a mandatory member
// (Int32 kind id, then the member's record), "optional" a Bool present flag
// followed, when set, by kind id and record.
//   UVWTexture (1):     member uvwgen
//   NoiseTexture (1):   member uvwgen; optional color1_tex; optional color2_tex;
//                       Color color1, color2; Float32 persistence, amplitude_ratio,
//                       frequency_ratio, frequency1, amplitude1, size, mix_ratio, bias,
//                       color1_tex_mult, color2_tex_mult; Int32 octaves, noiseType, inflection
//   CheckerTexture (2): member uvwgen, white_color, black_color; Bool tile_u, tile_v;
//                       Float32 whiteFactor, blackFactor            (version 1 ends before the factors)
//   GridTexture (2):    member uvwgen, line_color, fill_color;
//                       Float32 lineFactor, fillFactor, u_width, v_width
//                                                          (version 1 lacks the two factors)
//   ClothTexture (2):   member uvwgen; AColor gap_color, u_color, v_color;
//                       Float32 u_width, v_width; Bool tile    (version 1 ends before tile)
//   BulgeTexture (1):   member uvwgen; Float32 u_width, v_width
//   RampTexture (1):    member uvwgen, colors; Float32 positions, u_wave, v_wave;
//                       Int32 type, interpolation
// The factors of the checker and the grid are stored, copied and compared, and
// appear nowhere else.
#include <dexmor/textures/ColorTextures.hpp>
#include <dexmor/textures/TextureKind.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <span>

namespace OrvexKavorCore {

// The UVW coordinates themselves as a colour.
class UVWTexture final : public TextureKind<UVWTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kUVW, .version = 1, .pluginType = "TexUVW", .what = "UVW texture"};

    UVWPtr uvwgen;

    static std::span<const texture::Member<UVWTexture>> members();
    static std::span<const record::Field<UVWTexture>> fields();
    static std::span<const kind::ParameterRow<UVWTexture>> parameters();
};

class NoiseTexture final : public TextureKind<NoiseTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kNoise, .version = 1, .pluginType = "TexNoise",
                                    .what = "noise texture"};

    UVWPtr uvwgen;
    TexturePtr color1_tex;
    TexturePtr color2_tex;
    Color color1{1.0f, 1.0f, 1.0f};
    Color color2{0.0f, 0.0f, 0.0f};
    float persistence = 1.0f;
    float amplitude_ratio = 1.0f;
    float frequency_ratio = 2.0f;
    float frequency1 = 1.0f;
    float amplitude1 = 1.0f;
    float size = 1.0f;
    float mix_ratio = 0.5f;
    float bias = 0.0f;
    float color1_tex_mult = 1.0f;
    float color2_tex_mult = 1.0f;
    std::int32_t octaves = 3;
    std::int32_t noiseType = 0;
    std::int32_t inflection = 0;

    NoiseTexture() = default;
    NoiseTexture(const NoiseTexture&) = default;
    NoiseTexture& operator=(const NoiseTexture&) = default;
    ~NoiseTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<NoiseTexture>> members();
    static std::span<const record::Field<NoiseTexture>> fields();
    static std::span<const kind::ParameterRow<NoiseTexture>> parameters();
};

// Two colours in alternating squares. A new checker holds a planar world
// generator, a white (1, 1, 1, 1) and a black (0, 0, 0, 1) colour texture; every
// reset makes new ones.
class CheckerTexture final : public TextureKind<CheckerTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kChecker, .version = 2, .pluginType = "TexChecker",
                                    .what = "checker texture"};

    UVWPtr uvwgen = boost::make_shared<GenPlanarWorldUVW>();
    TexturePtr white_color = boost::make_shared<AColorTexture>(AColor{1.0f, 1.0f, 1.0f, 1.0f});
    TexturePtr black_color = boost::make_shared<AColorTexture>(AColor{0.0f, 0.0f, 0.0f, 1.0f});
    float whiteFactor = 1.0f;
    float blackFactor = 1.0f;
    bool tile_u = true;
    bool tile_v = true;

    CheckerTexture() = default;
    CheckerTexture(const CheckerTexture&) = default;
    CheckerTexture& operator=(const CheckerTexture&) = default;
    ~CheckerTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<CheckerTexture>> members();
    static std::span<const record::Field<CheckerTexture>> fields();
    static std::span<const kind::ParameterRow<CheckerTexture>> parameters();
};

// Lines of one colour over a fill of another.
class GridTexture final : public TextureKind<GridTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kGrid, .version = 2, .pluginType = "TexGrid",
                                    .what = "grid texture"};

    UVWPtr uvwgen;
    TexturePtr line_color;
    TexturePtr fill_color;
    float lineFactor = 1.0f;
    float fillFactor = 1.0f;
    float u_width = 0.1f;
    float v_width = 0.1f;

    GridTexture() = default;
    GridTexture(const GridTexture&) = default;
    GridTexture& operator=(const GridTexture&) = default;
    ~GridTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<GridTexture>> members();
    static std::span<const record::Field<GridTexture>> fields();
    static std::span<const kind::ParameterRow<GridTexture>> parameters();
};

// Woven threads. `tile` is written as both "tile_u" and "tile_v".
class ClothTexture final : public TextureKind<ClothTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kCloth, .version = 2, .pluginType = "TexCloth",
                                    .what = "cloth texture"};

    UVWPtr uvwgen;
    AColor gap_color{1.0f, 1.0f, 1.0f, 1.0f};
    AColor u_color{0.0f, 0.0f, 0.0f, 1.0f};
    AColor v_color{1.0f, 1.0f, 1.0f, 1.0f};
    float u_width = 0.1f;
    float v_width = 0.1f;
    bool tile = true;

    static std::span<const texture::Member<ClothTexture>> members();
    static std::span<const record::Field<ClothTexture>> fields();
    static std::span<const kind::ParameterRow<ClothTexture>> parameters();
};

// A write without its generator fails after the version word is already written.
class BulgeTexture final : public TextureKind<BulgeTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kBulge, .version = 1, .pluginType = "TexBulge",
                                    .what = "bulge texture", .versionBeforeCheck = true};

    UVWPtr uvwgen;
    float u_width = 0.1f;
    float v_width = 0.1f;

    static std::span<const texture::Member<BulgeTexture>> members();
    static std::span<const record::Field<BulgeTexture>> fields();
    static std::span<const kind::ParameterRow<BulgeTexture>> parameters();
};

class RampTexture final : public TextureKind<RampTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kRamp, .version = 1, .pluginType = "TexRamp",
                                    .what = "ramp texture"};

    UVWPtr uvwgen;
    TexturePtr colors;
    float positions = 0.5f;
    float u_wave = 0.0f;
    float v_wave = 0.0f;
    std::int32_t type = 0;
    std::int32_t interpolation = 1;

    RampTexture() = default;
    RampTexture(const RampTexture&) = default;
    RampTexture& operator=(const RampTexture&) = default;
    ~RampTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<RampTexture>> members();
    static std::span<const record::Field<RampTexture>> fields();
    static std::span<const kind::ParameterRow<RampTexture>> parameters();
};

} // namespace OrvexKavorCore
