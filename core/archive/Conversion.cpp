#include "archive/Conversion.hpp"

#include "archive/ZelMatFile.hpp"
#include "archive/ZelOptFile.hpp"
#include "options/AllOptions.hpp"
#include "platform/FileIo.hpp"
#include "platform/Text.hpp"
#include "textures/SkyTexture.hpp"

#include <algorithm>
#include <cstring>

namespace OrvexKavorCore {

std::string_view extensionOf(FileKind kind) {
    return kind == FileKind::MaterialLibrary ? std::string_view("zelmat") : std::string_view("zelopt");
}

bool hasExtension(std::string_view path, std::string_view extension) {
    const auto dot = path.rfind('.');
    if (dot == std::string_view::npos) return false;
    return text::equalsIgnoringAsciiCase(path.substr(dot + 1), extension);
}

std::optional<FileKind> fileKindOf(std::string_view path) {
    for (FileKind kind : {FileKind::MaterialLibrary, FileKind::RenderOptions})
        if (hasExtension(path, extensionOf(kind))) return kind;
    return std::nullopt;
}

void convertToXml(FileKind kind, const std::filesystem::path& path, const TextSink& sink) {
    if (kind == FileKind::MaterialLibrary)
        ZelMatFile().toXml(path, sink);
    else
        ZelOptFile().toXml(path, sink);
}

void convertToXml(FileKind kind, const std::filesystem::path& path, const TextSink& sink,
                  const std::function<void()>& takeBack) {
    if (kind == FileKind::RenderOptions) return convertToXml(kind, path, sink); // sends only a whole document
    if (const std::optional<SharedBytes> bytes = readRegularFile(path)) ZelMatFile().bytesToXml(*bytes, sink, takeBack);
}

void appendXml(FileKind kind, const std::filesystem::path& path, std::string& document) {
    if (kind == FileKind::RenderOptions)
        return convertToXml(kind, path, [&document](std::string_view piece) { document.append(piece); });
    if (const std::optional<SharedBytes> bytes = readRegularFile(path)) ZelMatFile().bytesToXml(*bytes, document);
}

std::string convertToXml(FileKind kind, const std::filesystem::path& path) {
    std::string xml;
    appendXml(kind, path, xml);
    return xml;
}

std::string convertBytesToXml(FileKind kind, std::string_view bytes) {
    std::string xml;
    if (kind == FileKind::MaterialLibrary)
        ZelMatFile().bytesToXml(SharedBytes::copyOf(bytes), xml);
    else
        ZelOptFile().bytesToXml(bytes, [&xml](std::string_view piece) { xml.append(piece); });
    return xml;
}

std::string Diagnosis::reason() const {
    if (!opened) return "the file cannot be opened";
    return failure ? failure->describe() : std::string("no reason was recorded");
}

Diagnosis diagnose(FileKind kind, const std::filesystem::path& path) {
    const std::optional<SharedBytes> bytes = readRegularFile(path);
    if (!bytes) return Diagnosis{false, false, {}, ReadFailure{"the file cannot be opened", 0, {}}, 0};
    return diagnoseBytes(kind, bytes->view());
}

Diagnosis diagnoseBytes(FileKind kind, std::string_view bytes) {
    // Reading may change the shared default sun; start and leave it pristine.
    resetSharedDefaultSun();
    Diagnosis result;
    result.opened = true;
    if (kind == FileKind::MaterialLibrary) {
        ZelMatFile file;
        if (const auto framing = file.readThrough(SharedBytes::copyOf(bytes))) {
            result.readsAsBinary = true;
            result.description = "material library, generation " + std::to_string(framing->generation) + ", " +
                                 std::to_string(framing->count) +
                                 (framing->count == 1 ? " material" : " materials");
        } else {
            result.failure = file.lastReadFailure();
        }
    } else {
        ZelOptFile file;
        AllOptions options;
        if (file.readBytes(options, bytes)) {
            // The archive pads a short file with zero bytes, and so does this.
            VersionWord version{};
            std::memcpy(&version.raw, bytes.data(), std::min(bytes.size(), sizeof version.raw));
            result.readsAsBinary = true;
            result.description = "render options, version " + std::to_string(version.second());
        } else {
            result.failure = file.lastReadFailure();
        }
    }
    resetSharedDefaultSun();
    if (!result.readsAsBinary) result.fallbackLength = text::decodeStoredText(text::upToFirstNul(bytes)).size();
    return result;
}

} // namespace OrvexKavorCore
