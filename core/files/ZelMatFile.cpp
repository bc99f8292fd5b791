#include <dexmor/files/ZelMatFile.hpp>

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/materials/MaterialAssets.hpp>
#include "platform/FileIo.hpp"
#include <dexmor/platform/Text.hpp>

#include <algorithm>
#include <cstring>
#include <ios>
#include <istream>
#include <iterator>
#include <ostream>
#include <sstream>

namespace OrvexKavorCore {

namespace {

constexpr std::size_t kHeaderSize = 8;
constexpr VersionWord kWrittenVersion = VersionWord::make(0, 3);

std::uint32_t readLittleEndian32(const char* p) {
    std::uint32_t v = 0;
    std::memcpy(&v, p, sizeof v);
    return v;
}

} // namespace

std::optional<ZelMatFile::Framing> ZelMatFile::readFraming(std::string_view bytes, ReadFailure* failure) {
    return readFraming(SharedBytes::copyOf(bytes), failure);
}

std::optional<ZelMatFile::Framing> ZelMatFile::readFraming(const SharedBytes& shared, ReadFailure* failure) {
    const std::string_view bytes = shared.view();
    const auto reject = [&](std::string reason, std::uint64_t offset,
                            std::string recordPath = "header") -> std::optional<Framing> {
        if (failure) *failure = ReadFailure{std::move(reason), offset, {std::move(recordPath)}};
        return std::nullopt;
    };
    if (bytes.size() < kHeaderSize) return reject("the file is shorter than its 8-byte header", 0);
    const VersionWord version{readLittleEndian32(bytes.data())};
    const std::uint32_t count = readLittleEndian32(bytes.data() + 4);
    if (count == 0) return reject("the file holds no materials", 4);
    if (version.first() != 0 || version.second() < 1 || version.second() > 3)
        return reject("unknown file version (" + std::to_string(version.first()) + ", " +
                          std::to_string(version.second()) + ")",
                      0);

    const std::string_view body = bytes.substr(kHeaderSize);
    Framing framing{version.second(), count, QuickArchive(0), kHeaderSize, shared};
    switch (framing.generation) {
    case 1: {
        // The first generation's writer lost every carriage-return byte; so does its reader.
        std::string kept;
        kept.reserve(body.size());
        std::copy_if(body.begin(), body.end(), std::back_inserter(kept), [](char c) { return c != '\x0D'; });
        const SharedBytes keptBytes = SharedBytes::adopt(std::move(kept));
        framing.archive = QuickArchive::viewOf(keptBytes, 0, keptBytes.size());
        break;
    }
    case 2:
        framing.archive = QuickArchive::viewOf(shared, kHeaderSize, body.size());
        break;
    default: {
        // UInt32 chunk count, then the chunks; bytes after the last chunk are ignored.
        constexpr std::size_t kChunksAt = kHeaderSize + 4;
        if (body.size() < 4) return reject("the chunk count is missing", kHeaderSize, "archive image");
        const std::uint64_t chunks = readLittleEndian32(body.data());
        const std::uint64_t present = (bytes.size() - kChunksAt) / QuickArchive::kChunkSize;
        if (chunks > present)
            return reject("the archive ends inside chunk " + std::to_string(present) + " of " +
                              std::to_string(chunks),
                          kChunksAt + present * QuickArchive::kChunkSize, "archive image");
        framing.archive = QuickArchive::viewOf(shared, kChunksAt, chunks * QuickArchive::kChunkSize);
        framing.archiveStart = kChunksAt;
        break;
    }
    }
    if (framing.archive.failed()) {
        if (failure) *failure = *framing.archive.failure();
        return std::nullopt;
    }
    return framing;
}

std::uint64_t ZelMatFile::Framing::fileOffsetOf(std::uint64_t archivePosition) const {
    if (generation != 1) return archiveStart + archivePosition;
    // The archive holds the body's bytes without their carriage returns: find the
    // kept byte at that position.
    std::uint64_t kept = 0;
    const std::string_view bytes = file.view();
    for (std::uint64_t offset = archiveStart; offset < bytes.size(); ++offset) {
        if (bytes[offset] == '\x0D') continue;
        if (kept == archivePosition) return offset;
        ++kept;
    }
    return bytes.size() + (archivePosition - kept); // positions past the end count on from it
}

std::optional<ZelMatFile::Framing> ZelMatFile::frame(const SharedBytes& bytes) {
    lastReadFailure_.reset();
    ReadFailure failure;
    std::optional<Framing> framing = readFraming(bytes, &failure);
    if (!framing) lastReadFailure_ = std::move(failure);
    return framing;
}

bool ZelMatFile::readMaterials(Framing& framing, const std::function<void(MaterialPtr&&)>& take,
                               ReadFailure& failure) {
    QuickArchive& ar = framing.archive;
    // A material record takes at least a kind id and a version word.
    if (!ar.canHold(framing.count, 8)) {
        failure = ReadFailure{"a count of " + std::to_string(framing.count) + " materials cannot fit in the file", 4,
                              {"header"}};
        return false;
    }
    for (std::uint32_t i = 0; i < framing.count; ++i) {
        MaterialPtr material;
        if (!readMember(ar, material, nullptr, i)) {
            if (!ar.failed()) {
                QuickArchive::Scope scope(ar, "material", nullptr, i);
                ar.fail("the record was rejected");
            }
            // Failures are recorded at archive positions; the user needs file offsets.
            failure = *ar.failure();
            failure.offset = framing.fileOffsetOf(failure.offset);
            return false;
        }
        take(std::move(material));
    }
    return true;
}

bool ZelMatFile::readFromBytes(std::string_view bytes) {
    return readFromBytes(SharedBytes::copyOf(bytes));
}

bool ZelMatFile::readFromBytes(const SharedBytes& bytes) {
    std::optional<Framing> framing = frame(bytes);
    if (!framing) return false;
    std::vector<MaterialPtr> read;
    ReadFailure failure;
    if (!readMaterials(*framing, [&](MaterialPtr&& material) { read.push_back(std::move(material)); }, failure)) {
        lastReadFailure_ = std::move(failure);
        return false;
    }
    materials = std::move(read);
    return true;
}

bool ZelMatFile::readFromStream(std::istream& in) {
    const std::string bytes{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    return readFromBytes(bytes);
}

bool ZelMatFile::writeToStream(std::ostream& out) {
    lastError_.clear();
    if (materials.empty()) {
        lastError_ = "a material library needs at least one material";
        return false;
    }
    QuickArchive ar(1);
    for (const MaterialPtr& material : materials) {
        if (!material) {
            lastError_ = "the material list holds an empty entry";
            return false;
        }
        ar.write(static_cast<std::int32_t>(material->kindId()));
        if (!material->writeToArchive(ar)) {
            lastError_ = "An error has occurred while attempting to serialize \"" + material->name +
                         "\" - aborting zelmat creation";
            return false;
        }
    }
    out.write(reinterpret_cast<const char*>(&kWrittenVersion.raw), sizeof kWrittenVersion.raw);
    const auto count = static_cast<std::uint32_t>(materials.size());
    out.write(reinterpret_cast<const char*>(&count), sizeof count);
    ar.save(out);
    return static_cast<bool>(out);
}

bool ZelMatFile::add(const MaterialPtr& material) {
    materials.push_back(material);
    return true;
}

bool ZelMatFile::get(std::size_t index, MaterialPtr& out) const {
    if (index >= materials.size()) return false;
    out = materials[index];
    return true;
}

int ZelMatFile::indexOf(std::string_view name) const {
    for (std::size_t i = 0; i < materials.size(); ++i)
        if (materials[i] && text::equalsIgnoringAsciiCase(materials[i]->name, name)) return static_cast<int>(i);
    return -1;
}

bool ZelMatFile::get(std::string_view name, MaterialPtr& out) const {
    const int index = indexOf(name);
    return index >= 0 && get(static_cast<std::size_t>(index), out);
}

void ZelMatFile::names(std::vector<std::string>& out) const {
    for (const MaterialPtr& material : materials) out.push_back(material ? material->name : std::string());
}

bool ZelMatFile::load(const std::filesystem::path& path) {
    const std::optional<SharedBytes> bytes = readFile(path);
    return bytes && readFromBytes(*bytes);
}

bool ZelMatFile::save(const std::filesystem::path& path) {
    std::ostringstream out;
    if (!writeToStream(out)) return false;
    return writeFileAtomically(path, out.view(), &lastError_);
}

std::ios_base::openmode ZelMatFile::probeOpenMode(const std::filesystem::path& path) {
    const std::optional<FileContent> content = readRegularFile(path);
    if (!content) return std::ios_base::in;
    const SharedBytes& bytes = content->bytes;
    if (bytes.size() >= 4 && VersionWord{readLittleEndian32(bytes.data())}.is(0, 1)) return std::ios_base::in;
    return std::ios_base::in | std::ios_base::binary;
}

std::optional<SharedBytes> ZelMatFile::readFile(const std::filesystem::path& path) {
    FileError error;
    std::optional<FileContent> content = readRegularFile(path, &error);
    if (!content) {
        lastReadFailure_ = ReadFailure{"the file " + error.message, 0, {}};
        return std::nullopt;
    }
    return std::move(content->bytes);
}

std::string ZelMatFile::toXml(const MaterialPtr& material) {
    ConversionContext context;
    return materialToXml(material);
}

} // namespace OrvexKavorCore
