#pragma once
// The refraction layer.
//
// Record (VersionWord (0, 6)):
//   Color color, Color fogColor, Float32 ior, ior2, cutoff, fogColorMult, glossiness,
//   Int32 extraInt, subdivs, affectShadows, affectAlpha, Float32 colorTexMult,
//   glossinessTexMult, iorTexMult, Int32 translucencyOn, Float32 thickness,
//   scatterCoeff, scatterDirection, translucencyTexMult, Color translucency,
//   texture items colorTex, glossinessTex, iorTex, translucencyTex,
//   Color transparency, Float32 transparencyTexMult, texture item transparencyTex,
//   base record
// Older records:
//   1  color up to affectAlpha
//   2  1, then Float32 transparencyTexMult (where 5 has colorTexMult),
//      glossinessTexMult, iorTexMult, path items transparencyTex, glossinessTex, iorTex
//   3  2, then translucencyOn up to translucency, path item translucencyTex
//   4  3 with texture items transparencyTex, glossinessTex, iorTex, translucencyTex,
//      all four after translucency
//   5  6 without the base record
// A read resets only the name and the flags: a field that an older record lacks
// keeps the value the layer had.
//
// ior2 and extraInt are stored, copied and compared, never shown.
#include <dexmor/brdfs/BRDFKind.hpp>

namespace OrvexKavorCore {

class Glass_BRDF final : public BRDFKind<Glass_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kGlass, .version = 6, .pluginType = "BRDFRefraction",
                                    .what = "glass BRDF", .keepsFieldsOnRead = true};
    static std::span<const record::Field<Glass_BRDF>> fields();
    static std::span<const kind::ParameterRow<Glass_BRDF>> parameters();

    Color color{1.0f, 1.0f, 1.0f};
    Color transparency{0.0f, 0.0f, 0.0f};
    Color fogColor{1.0f, 1.0f, 1.0f};
    Color translucency{1.0f, 1.0f, 1.0f};
    float ior = 1.55f;
    float ior2 = 1.55f;
    float cutoff = 0.001f;
    float fogColorMult = 1.0f;
    float glossiness = 1.0f;
    float colorTexMult = 1.0f;
    float transparencyTexMult = 1.0f;
    float glossinessTexMult = 1.0f;
    float iorTexMult = 1.0f;
    float translucencyTexMult = 1.0f;
    float thickness = 1000.0f;
    float scatterCoeff = 0.0f;
    float scatterDirection = 1.0f;
    std::int32_t subdivs = 8;
    std::int32_t extraInt = 5;
    std::int32_t affectShadows = 0; // shown as bool
    std::int32_t affectAlpha = 0;   // shown as bool
    std::int32_t translucencyOn = 0; // shown as bool
    TexturePtr colorTex;
    TexturePtr transparencyTex;
    TexturePtr glossinessTex;
    TexturePtr iorTex;
    TexturePtr translucencyTex;
};

} // namespace OrvexKavorCore
