#pragma once
// The conversion that the Python module and the command-line tool both call: a
// stored file in, the text of its XML document out.
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

enum class FileKind {
    MaterialLibrary, // ".zelmat"
    RenderOptions,   // ".zelopt"
};

// "zelmat" or "zelopt".
std::string_view extensionOf(FileKind kind);

// The extension test: the text after the last "." anywhere in the path (directory
// names included) equals the extension, ignoring the case of ASCII letters. A path
// without a dot fails.
bool hasExtension(std::string_view path, std::string_view extension);

// The kind named by the path's extension, if any.
std::optional<FileKind> fileKindOf(std::string_view path);

// The XML text of a file that reads as a binary file of its kind; otherwise the
// file's own bytes up to the first NUL taken as text (strict UTF-8, else
// Windows-1252); the empty text for a file that cannot be opened. Never fails.
std::string convertToXml(FileKind kind, const std::filesystem::path& path);

} // namespace OrvexKavorCore
