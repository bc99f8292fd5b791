#include <dexmor/textures/BitmapBuffer.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/model/Kind.hpp>
#include <dexmor/platform/Text.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

constexpr VersionWord kVersion = VersionWord::make(0, 1);

constexpr std::array<std::string_view, 3> kFilterNames = {"No filter", "Mip-map", "Summed-area"};

} // namespace

std::string_view bitmapFilterName(std::int32_t filterType) {
    if (filterType < 0 || static_cast<std::size_t>(filterType) >= kFilterNames.size()) return {};
    return kFilterNames[static_cast<std::size_t>(filterType)];
}

bool BitmapBuffer::writeToArchive(QuickArchive& ar) {
    ar.write(kVersion);
    ar.write(filter_type);
    ar.write(filter_blur);
    ar.write(gamma);
    ar.writeWString(file);
    return true;
}

bool BitmapBuffer::readFromArchive(QuickArchive& ar) {
    if (!ar.readVersion(kVersion.second(), "bitmap buffer")) return false;
    ar.readAs("filter_type", filter_type);
    ar.readAs("filter_blur", filter_blur);
    ar.readAs("gamma", gamma);
    return ar.readWStringAs("file", file);
}

void BitmapBuffer::resetToDefaults() { *this = BitmapBuffer{}; }

BitmapPtr BitmapBuffer::clone() const { return boost::make_shared<BitmapBuffer>(*this); }

bool BitmapBuffer::isEqual(const BitmapPtr& other) const {
    const auto* o = dynamic_cast<const BitmapBuffer*>(other.get());
    return o && text::equalsIgnoringAsciiCase(file, o->file) && filter_blur == o->filter_blur &&
           filter_type == o->filter_type && gamma == o->gamma;
}

void BitmapBuffer::writeXml(AssetXmlWriter& writer, std::string url) {
    kind::beginAsset(writer, url, assetType(), pluginType());
    writer.writeInteger("filter_type", filter_type);
    writer.writeFloat("filter_blur", filter_blur);
    writer.writeFloat("gamma", gamma);
    writer.writeString("file", file);
    kind::endAsset(writer);
}

} // namespace OrvexKavorCore
