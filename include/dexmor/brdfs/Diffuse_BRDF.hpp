#pragma once
// The diffuse layer.
//
// Record (VersionWord (0, 3)):
//   Color color, Color transparency, Float32 colorTexMult, Float32 transparencyTexMult,
//   texture item colorTex, texture item transparencyTex, base record
// Older records: 2 is 3 without the base record; 1 stores path items (bitmap file
// names) in place of the two texture items.
#include <dexmor/brdfs/BRDFKind.hpp>

namespace OrvexKavorCore {

class Diffuse_BRDF final : public BRDFKind<Diffuse_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kDiffuse, .version = 3, .pluginType = "BRDFDiffuse",
                                    .what = "diffuse BRDF"};
    static std::span<const record::Field<Diffuse_BRDF>> fields();
    static std::span<const kind::ParameterRow<Diffuse_BRDF>> parameters();

    Color color{0.5f, 0.5f, 0.5f};
    Color transparency{0.0f, 0.0f, 0.0f};
    float colorTexMult = 1.0f;
    float transparencyTexMult = 1.0f;
    TexturePtr colorTex;
    TexturePtr transparencyTex;
};

} // namespace OrvexKavorCore
