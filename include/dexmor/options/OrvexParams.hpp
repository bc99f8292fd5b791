#pragma once
// OrvexParams: the renderer parameter block of the options set, stored with a
// record version of its own (newest 5). The options set shows its fields in its
// settings sections; the block itself writes no XML.
#include <dexmor/archive/Record.hpp>
#include <dexmor/options/KavorParams.hpp>
#include <dexmor/options/OrvexOptionsBase.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

class OrvexParams : public OrvexOptionsBase, public KavorUtils::KavorParams {
public:
    static constexpr std::uint16_t kVersion = 5;

    // VersionWord(0, 5), then every stored field in record order.
    bool writeToArchive(QuickArchive& ar) override;
    // Resets, then reads a record of version 1 to 5. Fields a version lacks keep
    // their defaults. Any other version word fails the read (the block then holds
    // its defaults).
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override;

    // The values an options set gives the block after its reset, where they differ
    // from the block's own defaults: filter on, sampler type 2, material depth
    // limited to 2, caustics search distance 20, DMC adaptive threshold 0.01, the
    // light cache's texts cleared and its adaptive sampling off.
    void applyOptionsSetOverrides();

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return "OrvexParams"; }
    std::string assetType() const override { return "settings"; }

    // Every stored field equal: what a write and read keep.
    bool isEqual(const OrvexParams& other) const;
    // Every field equal, the fields the record does not hold included.
    bool isIdentical(const OrvexParams& other) const {
        return static_cast<const KavorUtils::KavorParams&>(*this) == other;
    }
    // The name ("gi.on") of the first stored field that differs, or nullptr.
    const char* firstDifference(const OrvexParams& other) const;

    // The record as a table, one row per stored value in archive order.
    static std::span<const record::Field<KavorUtils::KavorParams>> recordFields();
};

} // namespace OrvexKavorCore
