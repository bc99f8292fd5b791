#pragma once
// The reflection layers: Mirror_BRDF, and Phong_BRDF and Blinn_BRDF, which share
// every field, record and parameter and differ only in kind. All three have the
// plugin type "BRDFReflection" and, by default, a Fresnel transparency texture
// of their own.
//
// Mirror record (VersionWord (0, 5)):
//   Color color, Color transparency, Float32 transparencyTexMult, Float32 cutoff,
//   Int32 extraInt, Float32 colorTexMult, texture items transparencyTex, colorTex,
//   base record
// Older mirror records (F = Float32 legacy index of refraction, S = Int32 legacy
// Fresnel switch, neither kept):
//   1  color, transparency, transparencyTexMult, F, cutoff, S, extraInt,
//      path item transparencyTex
//   2  1, then Float32 colorTexMult, path item colorTex
//   3  1 up to extraInt, then colorTexMult, texture items transparencyTex, colorTex
//   4  3 followed by the base record
//
// Phong and Blinn record (VersionWord (0, 6)):
//   Color color, Color transparency, Float32 hilightGlossiness, reflectionGlossiness,
//   cutoff, Int32 subdivs, backSide, extraInt, Float32 colorTexMult,
//   hilightGlossinessTexMult, reflectionGlossinessTexMult, transparencyTexMult,
//   texture items colorTex, hilightGlossinessTex, reflectionGlossinessTex,
//   transparencyTex, Float32 anisotropy, anisotropyRotation, base record
// Older records (F, S as above):
//   1  color, transparency, hilightGlossiness, reflectionGlossiness, F, cutoff,
//      subdivs, S, backSide, extraInt
//   2  1, then colorTexMult, hilightGlossinessTexMult, reflectionGlossinessTexMult,
//      path items colorTex, hilightGlossinessTex, reflectionGlossinessTex
//   3  2, then anisotropy, anisotropyRotation
//   4  1, the three multipliers, texture items colorTex, hilightGlossinessTex,
//      reflectionGlossinessTex, then anisotropy, anisotropyRotation
//   5  4 followed by the base record
//
// In every record that holds them, a Fresnel switch other than 0 makes the
// transparency texture, once the record is read, a new Fresnel texture whose
// fresnel_ior is the legacy index (whatever item or path the record held).
// extraInt is stored, copied and compared, never shown.
#include <dexmor/brdfs/BRDFKind.hpp>

namespace OrvexKavorCore {

namespace brdf {
// A new Fresnel texture with its defaults: the default transparency of the
// reflection layers, made for each layer.
TexturePtr defaultFresnel();
} // namespace brdf

class Mirror_BRDF final : public BRDFKind<Mirror_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kMirror, .version = 5, .pluginType = "BRDFReflection",
                                    .what = "mirror BRDF"};
    static std::span<const record::Field<Mirror_BRDF>> fields();
    static std::span<const kind::ParameterRow<Mirror_BRDF>> parameters();

    Color color{1.0f, 1.0f, 1.0f};
    Color transparency{1.0f, 1.0f, 1.0f};
    float transparencyTexMult = 1.0f;
    float colorTexMult = 1.0f;
    float cutoff = 0.01f;
    std::int32_t extraInt = 1;
    TexturePtr transparencyTex = brdf::defaultFresnel();
    TexturePtr colorTex;

private:
    brdf::LegacyFresnel legacyFresnel_; // only while an older record is read
};

// The fields of the Phong and Blinn layers.
template <class Leaf>
class GlossyReflection : public BRDFKind<Leaf, GlossyReflection<Leaf>> {
public:
    static std::span<const record::Field<GlossyReflection>> fields();
    static std::span<const kind::ParameterRow<GlossyReflection>> parameters();

    Color color{1.0f, 1.0f, 1.0f};
    Color transparency{1.0f, 1.0f, 1.0f};
    float hilightGlossiness = 1.0f;
    float reflectionGlossiness = 1.0f;
    float cutoff = 0.01f;
    float hilightGlossinessTexMult = 1.0f;
    float reflectionGlossinessTexMult = 1.0f;
    float colorTexMult = 1.0f;
    float transparencyTexMult = 1.0f;
    float anisotropy = 0.0f;
    float anisotropyRotation = 0.0f;
    std::int32_t subdivs = 8;
    std::int32_t extraInt = 5;
    std::int32_t backSide = 0;
    TexturePtr hilightGlossinessTex;
    TexturePtr reflectionGlossinessTex;
    TexturePtr colorTex;
    TexturePtr transparencyTex = brdf::defaultFresnel();

protected:
    GlossyReflection() = default;
    GlossyReflection(const GlossyReflection&) = default;
    GlossyReflection& operator=(const GlossyReflection&) = default;

private:
    brdf::LegacyFresnel legacyFresnel_; // only while an older record is read
};

class Phong_BRDF final : public GlossyReflection<Phong_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kPhong, .version = 6, .pluginType = "BRDFReflection",
                                    .what = "Phong BRDF"};
};

class Blinn_BRDF final : public GlossyReflection<Blinn_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kBlinn, .version = 6, .pluginType = "BRDFReflection",
                                    .what = "Blinn BRDF"};
};

extern template class GlossyReflection<Phong_BRDF>;
extern template class GlossyReflection<Blinn_BRDF>;

} // namespace OrvexKavorCore
