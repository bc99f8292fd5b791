#pragma once
// The two material kinds that hold BRDF layers directly.
//
// MaterialLayeredBRDF (kind 1, "MtlORVEX"): an ordered stack of BRDF layers and a
// few material-wide options. The XML of a material library is built around it.
//   VersionWord (0, 4)
//   UInt32      number of layers, then each layer: Int32 BRDF kind id, its record
//   Int32       doubleSided, option1
//   Int32       option2, option3          (version 3 on)
//   WString     name item                 (version 1 only; through the unique-name rule)
//               base record               (version 2 on)
//   Int32       option4                   (version 4)
// The reader resets first (layers cleared, a fresh default name).
//
// MaterialSingleBRDF (kind 0, "MtlSingleBRDF"): exactly one BRDF layer.
//   VersionWord (0, 2)
//   Int32       option1, option2
//   WString     name item                 (version 1 only)
//   Int32       BRDF kind id, the BRDF's record
//               base record               (version 2)
// The reader reads over the current fields. It writes no XML of its own.
//
// The integer options other than doubleSided are stored, compared and copied,
// never shown in the XML.
#include <dexmor/materials/ListReplay.hpp>
#include <dexmor/materials/MaterialKind.hpp>

#include <functional>
#include <span>
#include <string>
#include <vector>

namespace OrvexKavorCore {

class AssetXmlWriter;

class MaterialLayeredBRDF final : public MaterialKind<MaterialLayeredBRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kLayeredBRDF,
                                    .version = 4,
                                    .pluginType = "MtlORVEX",
                                    .what = "layered material",
                                    .resetTakesName = true};
    static constexpr const char* kLayout = "defkvmat";

    using MaterialKind::MaterialKind;

    std::vector<BRDFPtr> layers; // first layer first
    // While a library is converted, the layers of a material with very many are
    // not held but read again as they are written (see ListReplay.hpp).
    ReplayedList replayedLayers;
    std::int32_t doubleSided = 1;
    std::int32_t option1 = 0;
    std::int32_t option2 = 1;
    std::int32_t option3 = 1;
    std::int32_t option4 = 0;

    static std::span<const record::Field<MaterialLayeredBRDF>> fields();
    bool canBeWritten() const;
    // Copies own new layer objects.
    bool separate(bool renamed);

    // The material's own asset under urlPrefix + "/" + name: the layers' assets,
    // then the "defkvmat" asset with "double_sided" and the "brdfs" list.
    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override;

    // The assets of the layers, each under `url` + "/" + its name.
    void writeLayerAssets(AssetXmlWriter& writer, const std::string& url) const;
    // "double_sided" and "brdfs" (url + "/" + layer name per layer).
    void writeLayerParameters(AssetXmlWriter& writer, const std::string& url) const;

private:
    void forEachLayer(const std::function<void(const BRDFPtr&)>& visit) const;
};

class MaterialSingleBRDF final : public MaterialKind<MaterialSingleBRDF> {
public:
    static constexpr KindInfo kInfo{.kind = kSingleBRDF,
                                    .version = 2,
                                    .pluginType = "MtlSingleBRDF",
                                    .what = "single-BRDF material",
                                    .keepsFieldsOnRead = true,
                                    .resetTakesName = true};

    using MaterialKind::MaterialKind;

    BRDFPtr brdf; // required by the record; copies share it
    std::int32_t option1 = 0;
    std::int32_t option2 = 0;

    static std::span<const record::Field<MaterialSingleBRDF>> fields();
    bool canBeWritten() const { return static_cast<bool>(brdf); }
};

} // namespace OrvexKavorCore
