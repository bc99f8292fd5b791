#pragma once
// OrvexVFBStampInfo: the text stamp the frame buffer draws over a rendered image,
// stored with a record version of its own (newest 2). The options set keeps one;
// it writes no XML.
#include <dexmor/options/OrvexOptionsBase.hpp>

#include <array>
#include <cstdint>
#include <string>

namespace KavorUtils {

// The renderer's stamp record. The text holds placeholders ("%rendertime") that
// the renderer fills in when it draws the stamp; it is kept unchanged. The block
// is opaque and kept for the round trip only.
struct KavorVFBStampInfo {
    static constexpr std::size_t kBlockSize = 60;
    static constexpr const char* kDefaultText = "Kavor Core %kavorcore | Render Time %rendertime |";

    std::int32_t si_i1 = 0;
    std::string text = kDefaultText; // UTF-8
    std::int32_t si_i2 = 0;
    std::int32_t si_i3 = 0;
    std::array<std::uint8_t, kBlockSize> si_block{};

    friend bool operator==(const KavorVFBStampInfo&, const KavorVFBStampInfo&) = default;
};

} // namespace KavorUtils

namespace OrvexKavorCore {

class OrvexVFBStampInfo : public OrvexOptionsBase, public KavorUtils::KavorVFBStampInfo {
public:
    static constexpr std::uint16_t kVersion = 2;

    // Record (version 2): VersionWord(0, 2), Int32 si_i1, si_i2, si_i3, WString text,
    // then the block as Bytes (UInt32 60 and the 60 bytes).
    bool writeToArchive(QuickArchive& ar) override;
    // Resets, then reads version 1 or 2. Version 1 stores the block as 60 raw bytes
    // without a count. In version 2 a stored count below 60 fills that many bytes
    // (the rest stays zero) and one above 60 has its surplus skipped.
    bool readFromArchive(QuickArchive& ar) override;
    void resetToDefaults() override;

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return "VFBStampInfo"; }
    std::string assetType() const override { return "settings"; }

    bool isEqual(const OrvexVFBStampInfo& other) const {
        return static_cast<const KavorUtils::KavorVFBStampInfo&>(*this) == other;
    }
};

} // namespace OrvexKavorCore
