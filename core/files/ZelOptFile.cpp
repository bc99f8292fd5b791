#include <dexmor/files/ZelOptFile.hpp>

#include "platform/FileIo.hpp"

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
    FileError error;
    const std::optional<FileContent> content = readRegularFile(path, &error);
    if (!content) {
        lastReadFailure_ = ReadFailure{"the file " + error.message, 0, {}};
        return false;
    }
    return readBytes(object, content->bytes.view());
}

bool ZelOptFile::readBytes(OrvexSerializable& object, std::string_view bytes, ReadObserver* observer) {
    lastReadFailure_.reset();
    if (bytes.empty()) {
        lastReadFailure_ = ReadFailure{"the file is empty", 0, {}};
        return false;
    }
    QuickArchive ar(bytes.data(), bytes.size());
    ar.observe(observer);
    if (!ar.failed() && object.readFromArchive(ar)) return true;
    if (!ar.failed()) ar.fail("the record was rejected");
    lastReadFailure_ = ar.failure();
    return false;
}

} // namespace OrvexKavorCore
