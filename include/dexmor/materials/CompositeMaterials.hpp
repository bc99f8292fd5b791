#pragma once
// The material kinds that combine several materials: a list (multi), front and
// back (two-sided, and the host product's own two-sided kind) and a blend by
// viewing angle. In the XML of a material library the two-sided and angle-blend
// kinds keep an asset of their own that refers to the folded assets of their
// sub-materials (MaterialAssets.hpp); their writeXml is the unfolded form.
//
// Records, current versions ("member": Bool present, then when present Int32 kind
// id and record; "required": kind id and record without a flag):
//   multi (0, 2):      UInt32 count, that many required sub-materials, base record
//     version 1:       the same with the name item in place of the base record
//   two-sided (0, 3):  front, back, translucencyTex (members), Color translucency,
//                      Float32 translucencyTexMult, Bool force1Sided, then (version 2
//                      on) transparencyTex, Color transparency, Float32
//                      transparencyTexMult, then (version 3) the base record
//   host two-sided (0, 1): base record, front, back, Bool force1Sided
//   angle blend (0, 1): base record, mtlOne, mtlTwo, Float32 startAngle, stopAngle
// The multi and both two-sided kinds read over their current fields (the multi
// appends to its list); the angle blend resets first. Only the multi's reset takes
// a new default name.
#include <dexmor/materials/ListReplay.hpp>
#include <dexmor/materials/MaterialKind.hpp>

#include <span>
#include <string>
#include <vector>

namespace OrvexKavorCore {

class MaterialMulti final : public MaterialKind<MaterialMulti> {
public:
    static constexpr KindInfo kInfo{.kind = kMulti,
                                    .version = 2,
                                    .pluginType = "MtlMulti",
                                    .what = "multi material",
                                    .keepsFieldsOnRead = true,
                                    .resetTakesName = true};
    using MaterialKind::MaterialKind;
    ~MaterialMulti() override { releaseMaterialMembers(); }

    // Every entry is required by the record. Copies share the entries.
    std::vector<MaterialPtr> subMaterials;
    // While a library is converted, very many sub-materials are checked and not
    // held (the document shows none of them; see ListReplay.hpp).
    ReplayedList replayedSubMaterials;

    static std::span<const record::Field<MaterialMulti>> fields();
    bool canBeWritten() const;

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override;
};

class Material2Sided final : public MaterialKind<Material2Sided> {
public:
    static constexpr KindInfo kInfo{.kind = k2Sided,
                                    .version = 3,
                                    .pluginType = "Mtl2Sided",
                                    .what = "two-sided material",
                                    .keepsFieldsOnRead = true};
    using MaterialKind::MaterialKind;
    ~Material2Sided() override { releaseMaterialMembers(); }

    MaterialPtr front, back;
    TexturePtr translucencyTex, transparencyTex; // copies share them
    Color translucency{}, transparency{};
    float translucencyTexMult = 1.0f, transparencyTexMult = 1.0f;
    bool force1Sided = false;

    static std::span<const record::Field<Material2Sided>> fields();
    static std::span<const kind::ParameterRow<Material2Sided>> parameters();
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override;
};

class MaterialSkp2Sided final : public MaterialKind<MaterialSkp2Sided> {
public:
    static constexpr KindInfo kInfo{.kind = kSkp2Sided,
                                    .version = 1,
                                    .pluginType = "MtlSkp2Sided",
                                    .what = "host two-sided material",
                                    .keepsFieldsOnRead = true};
    using MaterialKind::MaterialKind;
    ~MaterialSkp2Sided() override { releaseMaterialMembers(); }

    MaterialPtr front, back;
    bool force1Sided = false;

    static std::span<const record::Field<MaterialSkp2Sided>> fields();
    static std::span<const kind::ParameterRow<MaterialSkp2Sided>> parameters();
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override;
};

class MaterialAngleBlend final : public MaterialKind<MaterialAngleBlend> {
public:
    static constexpr KindInfo kInfo{.kind = kAngleBlend,
                                    .version = 1,
                                    .pluginType = "MtlAngleBlend",
                                    .what = "angle blend material"};
    using MaterialKind::MaterialKind;
    ~MaterialAngleBlend() override { releaseMaterialMembers(); }

    MaterialPtr mtlOne, mtlTwo;
    float startAngle = 75.0f;
    float stopAngle = 150.0f;

    static std::span<const record::Field<MaterialAngleBlend>> fields();
    static std::span<const kind::ParameterRow<MaterialAngleBlend>> parameters();
    bool separate(bool renamed);

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override;
};

} // namespace OrvexKavorCore
