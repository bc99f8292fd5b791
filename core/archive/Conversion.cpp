#include "archive/Conversion.hpp"

#include "archive/ZelMatFile.hpp"
#include "archive/ZelOptFile.hpp"
#include "platform/Text.hpp"

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

std::string convertToXml(FileKind kind, const std::filesystem::path& path) {
    if (kind == FileKind::MaterialLibrary) return ZelMatFile().toXml(path);
    return ZelOptFile().toXml(path);
}

} // namespace OrvexKavorCore
