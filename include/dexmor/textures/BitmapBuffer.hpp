#pragma once
// BitmapBuffer: an image file and how a bitmap texture filters and gamma-corrects
// it. The image itself is never opened here; the path travels as text into the
// XML document.
//
// Record (version 0.1):
//   VersionWord (0, 1)
//   Int32    filter_type
//   Float32  filter_blur
//   Float32  gamma
//   WString  file
#include <dexmor/textures/BaseBitmap.hpp>

#include <cstdint>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

class BitmapBuffer final : public BaseBitmap {
public:
    enum FilterType : std::int32_t { kNoFilter = 0, kMipMap = 1, kSummedArea = 2 };

    std::string file; // UTF-8 path of the image
    std::int32_t filter_type = kMipMap;
    float filter_blur = 0.15f;
    float gamma = 1.0f;

    bool writeToArchive(QuickArchive& ar) override;
    // Does not reset first: a record of another version leaves every field as it was.
    bool readFromArchive(QuickArchive& ar) override;

    void resetToDefaults() override;
    std::int32_t kindId() const override { return kBuffer; }
    BitmapPtr clone() const override;
    // Same kind, the file paths equal ignoring the case of ASCII letters, and the
    // three numbers exactly equal.
    bool isEqual(const BitmapPtr& other) const override;

    void writeXml(AssetXmlWriter& writer, std::string url) override;
    std::string pluginType() const override { return "BitmapBuffer"; }
};

// The display name of a filter type ("No filter", "Mip-map", "Summed-area"); the
// empty text for a value that names no filter.
std::string_view bitmapFilterName(std::int32_t filterType);

} // namespace OrvexKavorCore
