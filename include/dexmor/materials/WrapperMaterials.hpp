#pragma once
// The material kinds that wrap one base material and add an effect: bump,
// displacement, environment overrides, object exclusion, alpha contribution and
// toon outlines. In the XML of a material library the first five are folded into
// the asset of the layered material below them (MaterialAssets.hpp); the toon
// keeps an asset of its own. Their writeXml is the unfolded form: the base
// material's asset, the textures' assets, then the kind's own asset.
//
// Records, current versions (a "member" is Bool present, then when present Int32
// kind id and the member's record; "required" has no present flag):
//   bump (0, 3):      Float32 bumpTexMult, texture member bumpTex, required baseMtl,
//                     base record
//     version 1:      name item, WString bitmap path of bumpTex, Float32 bumpTexMult,
//                     required baseMtl
//     version 2:      WString name (kept as stored), Float32 bumpTexMult, texture
//                     member bumpTex, required baseMtl
//   displaced (0, 2): base record, baseMtl, displaceTex, Float32 displaceTexMult,
//                     then (version 2) Float32 displaceShift, displaceEdgeLength,
//                     Int32 displaceMaxSubdivs, displaceContinuity,
//                     displaceViewDependent, displaceUseGlobals
//   override environment (0, 1): base record, baseMtl, bgTex, giTex, reflectTex,
//                     refractTex, Color bg/gi/reflect/refract colours, Float32
//                     bg/gi/reflect/refract multipliers, Bool overrideBg/Gi/Reflect/Refract
//   object exclusion (0, 3): Int32 mode, baseMtl, UInt32 count and WString object
//                     names, base record (version 2 on), Bool shortCircuit (version 3)
//   alpha contribution (0, 1): base record, baseMtl, alphaTex, Float32 alphaTexMult, alpha
//   toon (0, 2):      baseMtl, line width, opacity, distortion (each Float32 value,
//                     Float32 multiplier, texture member), Color lineColor, Float32
//                     lineColorTexMult, lineColorTex, Float32 zThreshold, traceBias,
//                     normalThreshold, lineUnits, Bool doSecondary, divideByDist, base
//                     record, then (version 2) Bool doSilhouetteMult, Float32 silhouetteMult
// The bump reads over its current fields and its reset takes a new default name;
// the others reset before reading and their resets keep the name.
#include <dexmor/materials/MaterialKind.hpp>

#include <span>
#include <string>
#include <vector>

namespace OrvexKavorCore {

class MaterialBump final : public MaterialKind<MaterialBump> {
public:
    static constexpr KindInfo kInfo{.kind = kBump,
                                    .version = 3,
                                    .pluginType = "MtlBump",
                                    .what = "bump material",
                                    .keepsFieldsOnRead = true,
                                    .resetTakesName = true};
    using MaterialKind::MaterialKind;
    ~MaterialBump() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl; // required by the record
    TexturePtr bumpTex;
    float bumpTexMult = 1.0f;

    static std::span<const record::Field<MaterialBump>> fields();
    static std::span<const kind::ParameterRow<MaterialBump>> parameters();
    bool canBeWritten() const { return static_cast<bool>(baseMtl); }
    bool readVersion(QuickArchive& ar, unsigned version);
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

class MaterialDisplaced final : public MaterialKind<MaterialDisplaced> {
public:
    static constexpr KindInfo kInfo{.kind = kDisplaced,
                                    .version = 2,
                                    .pluginType = "MtlDisplaced",
                                    .what = "displaced material"};
    using MaterialKind::MaterialKind;
    ~MaterialDisplaced() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl;
    TexturePtr displaceTex;
    float displaceTexMult = 1.0f;
    float displaceShift = 0.0f;
    float displaceEdgeLength = 4.0f;
    std::int32_t displaceMaxSubdivs = 256;
    std::int32_t displaceContinuity = 1;
    std::int32_t displaceViewDependent = 1;
    std::int32_t displaceUseGlobals = 1;

    static std::span<const record::Field<MaterialDisplaced>> fields();
    bool separate(bool renamed);
    // No asset of its own: the base material's, under this material's url.
    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override;

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

class MaterialOverrideEnvironment final : public MaterialKind<MaterialOverrideEnvironment> {
public:
    static constexpr KindInfo kInfo{.kind = kOverrideEnvironment,
                                    .version = 1,
                                    .pluginType = "MtlOverrideEnvironment",
                                    .what = "override environment material"};
    using MaterialKind::MaterialKind;
    ~MaterialOverrideEnvironment() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl;
    TexturePtr giTex, bgTex, reflectTex, refractTex;
    Color giColor{}, bgColor{}, reflectColor{}, refractColor{};
    float bgTexMult = 1.0f, giTexMult = 1.0f, reflectTexMult = 1.0f, refractTexMult = 1.0f;
    bool overrideBg = false, overrideGi = false, overrideReflect = false, overrideRefract = false;

    static std::span<const record::Field<MaterialOverrideEnvironment>> fields();
    bool separate(bool renamed);
    // No asset of its own: the base material's, under this material's url.
    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override;

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

class MaterialObjectExclusion final : public MaterialKind<MaterialObjectExclusion> {
public:
    static constexpr KindInfo kInfo{.kind = kObjectExclusion,
                                    .version = 3,
                                    .pluginType = "MtlObjectExclusion",
                                    .what = "object exclusion material"};
    using MaterialKind::MaterialKind;
    ~MaterialObjectExclusion() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl;
    std::int32_t mode = 0; // not 0: the listed objects are ignored
    std::vector<std::string> objects;
    bool shortCircuit = true;

    static std::span<const record::Field<MaterialObjectExclusion>> fields();
    static std::span<const kind::ParameterRow<MaterialObjectExclusion>> parameters();
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

class MaterialAlphaContribution final : public MaterialKind<MaterialAlphaContribution> {
public:
    static constexpr KindInfo kInfo{.kind = kAlphaContribution,
                                    .version = 1,
                                    .pluginType = "MtlAlphaContribution",
                                    .what = "alpha contribution material"};
    using MaterialKind::MaterialKind;
    ~MaterialAlphaContribution() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl;
    TexturePtr alphaTex;
    float alphaTexMult = 1.0f;
    float alpha = 1.0f;

    static std::span<const record::Field<MaterialAlphaContribution>> fields();
    static std::span<const kind::ParameterRow<MaterialAlphaContribution>> parameters();
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

class MaterialToon final : public MaterialKind<MaterialToon> {
public:
    static constexpr KindInfo kInfo{.kind = kToon,
                                    .version = 2,
                                    .pluginType = "MtlToon",
                                    .what = "toon material"};
    using MaterialKind::MaterialKind;
    ~MaterialToon() override { releaseMaterialMembers(); }

    MaterialPtr baseMtl;
    Color lineColor{};
    TexturePtr lineColorTex;
    float lineColorTexMult = 1.0f;
    float distort = 0.0f;
    TexturePtr distortTex;
    float distortTexMult = 1.0f;
    float opacity = 1.0f;
    TexturePtr opacityTex;
    float opacityTexMult = 1.0f;
    float lineWidth = 1.5f;
    TexturePtr lineWidthTex;
    float lineWidthTexMult = 1.0f;
    float zThreshold = 0.95f;
    float traceBias = 0.02f;
    float normalThreshold = 0.7f;
    float lineUnits = 1.0f; // stored and in the own asset only
    bool doSecondary = true;
    bool divideByDist = false;
    bool doSilhouetteMult = false;
    float silhouetteMult = 1.5f;

    static std::span<const record::Field<MaterialToon>> fields();
    static std::span<const kind::ParameterRow<MaterialToon>> parameters();
    // Both copies give the base material a new name (a renamed copy).
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(baseMtl, out); }
};

} // namespace OrvexKavorCore
