#include "archive/ZelOptFile.hpp"

#include "options/AllOptions.hpp"
#include "platform/FileIo.hpp"
#include "platform/Text.hpp"
#include "textures/SkyTexture.hpp"
#include "xml/AssetXmlWriter.hpp"

#include <string_view>

namespace OrvexKavorCore {

bool ZelOptFile::writeFile(OrvexSerializable& object, const std::filesystem::path& path) {
    QuickArchive ar(1);
    if (!object.writeToArchive(ar)) return false;
    std::string image;
    image.reserve(ar.chunkCount() * QuickArchive::kChunkSize);
    for (const auto& chunk : ar.chunks())
        image.append(reinterpret_cast<const char*>(chunk->data()), QuickArchive::kChunkSize);
    return writeFileAtomically(path, image);
}

bool ZelOptFile::readFile(OrvexSerializable& object, const std::filesystem::path& path) {
    lastReadFailure_.reset();
    const std::optional<SharedBytes> bytes = readRegularFile(path);
    if (!bytes) {
        lastReadFailure_ = ReadFailure{"the file cannot be opened", 0, {}};
        return false;
    }
    return readBytes(object, bytes->view());
}

bool ZelOptFile::readBytes(OrvexSerializable& object, std::string_view bytes) {
    lastReadFailure_.reset();
    if (bytes.empty()) {
        lastReadFailure_ = ReadFailure{"the file is empty", 0, {}};
        return false;
    }
    QuickArchive ar(bytes.data(), bytes.size());
    if (!ar.failed() && object.readFromArchive(ar)) return true;
    if (!ar.failed()) ar.fail("the record was rejected");
    lastReadFailure_ = ar.failure();
    return false;
}

std::string ZelOptFile::toXml(const std::filesystem::path& path) {
    std::string xml;
    toXml(path, [&xml](std::string_view piece) { xml.append(piece); });
    return xml;
}

void ZelOptFile::toXml(const std::filesystem::path& path, const TextSink& sink) {
    const std::optional<SharedBytes> bytes = readRegularFile(path);
    if (!bytes) {
        lastReadFailure_ = ReadFailure{"the file cannot be opened", 0, {}};
        return;
    }
    bytesToXml(bytes->view(), sink);
}

void ZelOptFile::bytesToXml(std::string_view bytes, const TextSink& sink) {
    // Every conversion starts from a pristine default sun (sky textures share it).
    resetSharedDefaultSun();
    AllOptions options;
    if (readBytes(options, bytes)) {
        std::string xml;
        AssetXmlWriter writer(xml);
        writer.beginDocument();
        options.writeXml(writer, "");
        writer.endDocument();
        sink(xml);
        return;
    }
    // Not a binary options file: the file is taken to be XML text already.
    sink(text::decodeStoredText(text::upToFirstNul(bytes)));
}

} // namespace OrvexKavorCore
