#pragma once
// The conversion that the Python module and the command-line tool both call: a
// stored file in, the text of its XML document out.
#include "archive/QuickArchive.hpp"
#include "xml/TextSink.hpp"

#include <cstddef>
#include <filesystem>
#include <functional>
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
// The same, streamed: a material library is sent one material's block at a time
// and never held whole (the file's bytes are, once).
void convertToXml(FileKind kind, const std::filesystem::path& path, const TextSink& sink);
// The same, streamed to a destination that can drop what it was sent (a file
// not yet in place): a material library is read once. `takeBack` is called when
// the text sent so far must go; the whole text then follows.
void convertToXml(FileKind kind, const std::filesystem::path& path, const TextSink& sink,
                  const std::function<void()>& takeBack);
// The same, appended to `document`. The text is whole before anyone sees it, so a
// material library is read once, not twice as when streamed.
void appendXml(FileKind kind, const std::filesystem::path& path, std::string& document);
// The same for the bytes of a file in memory.
std::string convertBytesToXml(FileKind kind, std::string_view bytes);

// What the conversion of a file will find, for telling a user why a file did not
// read as binary.
struct Diagnosis {
    bool opened = false;        // false: the file cannot be opened; the conversion gives the empty text
    bool readsAsBinary = false; // the conversion gives the XML document
    // When it reads as binary: "material library, generation 3, 12 materials" or
    // "render options, version 23".
    std::string description;
    // Otherwise: the first failure the readers recorded, and the length in bytes
    // (UTF-8) of the pass-through text the conversion returns instead.
    std::optional<ReadFailure> failure;
    std::size_t fallbackLength = 0;

    // Why the file does not read as binary, for a user: the failure with its record
    // path and offset, or that the file cannot be opened.
    std::string reason() const;
};

Diagnosis diagnose(FileKind kind, const std::filesystem::path& path);
Diagnosis diagnoseBytes(FileKind kind, std::string_view bytes);

} // namespace OrvexKavorCore
