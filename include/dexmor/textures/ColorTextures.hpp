#pragma once
// Textures that make or combine colours without a UVW generator of their own:
// AColorTexture, FresnelTexture, InvertTexture, BlendTexture.
//
// Records, after the VersionWord (0, version); "member" and "optional" as in
// textures/TextureKind.hpp:
//   AColorTexture (1):  AColor texture
//   FresnelTexture (2): Color white_color, black_color; Float32 fresnel_ior, refract_ior,
//                       black_color_tex_mult, white_color_tex_mult, fresnel_ior_tex_mult,
//                       refract_ior_tex_mult; optional black_color_tex, white_color_tex,
//                       fresnel_ior_tex, refract_ior_tex
//                       (version 1: the two colours and the two indices only)
//   InvertTexture (1):  member texture; Bool invert_alpha
//   BlendTexture (2):   optional color_a, then (only when present) Float32 colorAFactor;
//                       optional color_b, then (only when present) Float32 colorBFactor;
//                       Float32 blend_amount
//                       (version 1: optional color_a, optional color_b, Float32 blend_amount)
#include <dexmor/textures/TextureKind.hpp>

#include <cstdint>
#include <span>

namespace OrvexKavorCore {

// One constant colour with alpha.
class AColorTexture final : public TextureKind<AColorTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kAColor, .version = 1, .pluginType = "TexAColor",
                                    .what = "colour texture"};

    AColor texture{1.0f, 1.0f, 1.0f, 1.0f};

    AColorTexture() = default;
    explicit AColorTexture(const AColor& color) : texture(color) {}

    static std::span<const texture::Member<AColorTexture>> members();
    static std::span<const record::Field<AColorTexture>> fields();
    static std::span<const kind::ParameterRow<AColorTexture>> parameters();
};

// Blends two colours by the Fresnel term of an index of refraction. Its asset
// always carries "old_way" true. The reflection and refraction textures are the
// child assets "reflection_tex" and "refraction_tex".
class FresnelTexture final : public TextureKind<FresnelTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kFresnel, .version = 2, .pluginType = "TexFresnel",
                                    .what = "Fresnel texture", .membersFirst = false};

    TexturePtr black_color_tex;
    TexturePtr white_color_tex;
    TexturePtr fresnel_ior_tex;
    TexturePtr refract_ior_tex;
    Color white_color{1.0f, 1.0f, 1.0f};
    Color black_color{65.0f / 255.0f, 65.0f / 255.0f, 65.0f / 255.0f};
    float fresnel_ior = 1.55f;
    float refract_ior = 1.55f;
    float black_color_tex_mult = 1.0f;
    float white_color_tex_mult = 1.0f;
    float fresnel_ior_tex_mult = 1.0f;
    float refract_ior_tex_mult = 1.0f;

    FresnelTexture() = default;
    FresnelTexture(const FresnelTexture&) = default;
    FresnelTexture& operator=(const FresnelTexture&) = default;
    ~FresnelTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<FresnelTexture>> members();
    static std::span<const record::Field<FresnelTexture>> fields();
    static std::span<const kind::ParameterRow<FresnelTexture>> parameters();
};

// The inverse of another texture, written as the child asset "base_texture".
class InvertTexture final : public TextureKind<InvertTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kInvert, .version = 1, .pluginType = "TexInvert",
                                    .what = "invert texture"};

    TexturePtr texture;
    bool invert_alpha = false;

    InvertTexture() = default;
    InvertTexture(const InvertTexture&) = default;
    InvertTexture& operator=(const InvertTexture&) = default;
    ~InvertTexture() override { releaseTextureMembers(); }

    static std::span<const texture::Member<InvertTexture>> members();
    static std::span<const record::Field<InvertTexture>> fields();
    static std::span<const kind::ParameterRow<InvertTexture>> parameters();
};

// A mix of two textures. Each factor is stored right after its texture and only
// when that texture is present, so a record without color_a reads back with
// colorAFactor at 1.0.
class BlendTexture final : public TextureKind<BlendTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kBlend, .version = 2, .pluginType = "TexBlend",
                                    .what = "blend texture"};

    TexturePtr color_a;
    TexturePtr color_b;
    float colorAFactor = 1.0f;
    float colorBFactor = 1.0f;
    float blend_amount = 0.5f;

    BlendTexture() = default;
    BlendTexture(const BlendTexture&) = default;
    BlendTexture& operator=(const BlendTexture&) = default;
    ~BlendTexture() override { releaseTextureMembers(); }

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;

    static std::span<const texture::Member<BlendTexture>> members();
    // For comparison; the record is written by hand.
    static std::span<const record::Field<BlendTexture>> fields();
    static std::span<const kind::ParameterRow<BlendTexture>> parameters();
};

} // namespace OrvexKavorCore
