#pragma once
// The self-illumination layer.
//
// Record (VersionWord (0, 5)):
//   Color color, Color transparency, Float32 intensity, extraFloat, colorTexMult,
//   transparencyTexMult, texture items colorTex, transparencyTex, base record,
//   Int32 doubleSided
// Older records:
//   1  Color color, Float32 intensity, Float32 transparencyTexMult, path item transparencyTex
//   2  color, transparency, intensity, extraFloat, colorTexMult, transparencyTexMult,
//      path items colorTex, transparencyTex
//   3  2 with texture items;  4  3 followed by the base record
// extraFloat is stored, copied and compared, never shown. The transparency
// texture's asset is the child "transp_texture".
#include <dexmor/brdfs/BRDFKind.hpp>

namespace OrvexKavorCore {

class Light_BRDF final : public BRDFKind<Light_BRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kLight, .version = 5, .pluginType = "BRDFLight",
                                    .what = "light BRDF"};
    static std::span<const record::Field<Light_BRDF>> fields();
    static std::span<const kind::ParameterRow<Light_BRDF>> parameters();

    Color color{1.0f, 1.0f, 1.0f};
    Color transparency{0.0f, 0.0f, 0.0f};
    float intensity = 1.0f;
    float extraFloat = 1.0f;
    float transparencyTexMult = 1.0f;
    float colorTexMult = 1.0f;
    TexturePtr transparencyTex;
    TexturePtr colorTex;
    std::int32_t doubleSided = 1; // shown as bool
};

} // namespace OrvexKavorCore
