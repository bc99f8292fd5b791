#pragma once
// Dexmor: converting material libraries (".zelmat") and render-options files
// (".zelopt") to XML asset documents. This header is all a program converting
// files needs:
//
//   OrvexKavorCore::StringSink sink(xml);
//   const OrvexKavorCore::Diagnosis result =
//       OrvexKavorCore::convert(OrvexKavorCore::FileKind::MaterialLibrary, "library.zelmat", sink);
//
// A file that reads as a binary file of its kind gives its XML document; any
// other file is taken to be XML text already and gives its own bytes up to the
// first NUL (strict UTF-8, else Windows-1252), and the result says why it did
// not read; a file that cannot be opened gives nothing.
#include <dexmor/archive/ReadFailure.hpp>
#include <dexmor/version.hpp>

#include <cstddef>
#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

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

// What a conversion reads: a file by its path (read once, only a regular file),
// or the bytes of a file in memory (read in place: they must outlive the call).
class Input {
public:
    Input(std::filesystem::path path) : source_(std::move(path)) {}
    Input(const char* path) : source_(std::filesystem::path(path)) {}
    static Input ofBytes(std::string_view bytes) { return Input(bytes); }

    const std::filesystem::path* path() const { return std::get_if<std::filesystem::path>(&source_); }
    const std::string_view* bytes() const { return std::get_if<std::string_view>(&source_); }

private:
    explicit Input(std::string_view bytes) : source_(bytes) {}
    std::variant<std::filesystem::path, std::string_view> source_;
};

// Where a conversion sends its document: in order, in pieces of bounded size, as
// the text is produced (a piece is valid only during the call).
class DocumentSink {
public:
    virtual ~DocumentSink() = default;
    virtual void write(std::string_view piece) = 0;
    // Whether everything sent so far can be dropped again. A conversion into such
    // a destination reads a library once, and takes its text back in the rare case
    // that it must start again; into any other it reads the library through first,
    // so that nothing is sent for a file that turns out not to read.
    virtual bool canTakeBack() const { return false; }
    // Drops everything sent so far (only called when canTakeBack()).
    virtual void takeBack() {}
    // A hint: about this many more bytes are coming.
    virtual void expect(std::size_t /*bytes*/) {}
    // The string that holds the whole document, for a sink that has one: the
    // conversion then writes into it directly instead of sending pieces.
    virtual std::string* wholeText() { return nullptr; }
};

// Appends the document to a string.
class StringSink final : public DocumentSink {
public:
    explicit StringSink(std::string& document) : document_(document), start_(document.size()) {}
    void write(std::string_view piece) override { document_.append(piece); }
    bool canTakeBack() const override { return true; }
    void takeBack() override { document_.resize(start_); }
    void expect(std::size_t bytes) override;
    std::string* wholeText() override { return &document_; }

private:
    std::string& document_;
    std::size_t start_;
};

// Hands each piece to a function (standard output, a socket, a hash).
class CallbackSink final : public DocumentSink {
public:
    explicit CallbackSink(std::function<void(std::string_view)> take) : take_(std::move(take)) {}
    void write(std::string_view piece) override { take_(piece); }

private:
    std::function<void(std::string_view)> take_;
};

class AtomicFileWriter;

// Writes the document to a temporary file beside `target` and puts it in place
// with commit(); without a successful commit the target is left as it was and the
// temporary removed.
class AtomicFileSink final : public DocumentSink {
public:
    explicit AtomicFileSink(std::filesystem::path target);
    ~AtomicFileSink() override;
    void write(std::string_view piece) override;
    bool canTakeBack() const override { return true; }
    void takeBack() override;
    // False, with `error` (when given) saying why, when any write, the sync, the
    // close or the rename failed.
    bool commit(std::string* error = nullptr);
    std::size_t bytesWritten() const { return written_; }

private:
    std::unique_ptr<AtomicFileWriter> file_;
    std::size_t written_ = 0;
};

// What a conversion found, from the reading that converted the file.
struct Diagnosis {
    bool opened = false;        // false: the file cannot be opened; nothing was written
    bool readsAsBinary = false; // the document was written; otherwise the pass-through text
    // When it reads as binary: "material library, generation 3, 12 materials" or
    // "render options, version 23".
    std::string description;
    // Otherwise: the first failure the readers recorded, and the length in bytes
    // (UTF-8) of the pass-through text written instead.
    std::optional<ReadFailure> failure;
    std::size_t fallbackLength = 0;

    // Why the file does not read as binary, for a user: the failure with its record
    // path and offset, or that the file cannot be opened.
    std::string reason() const;
};

// Converts `input` as a file of `kind` into `sink`. Never throws for any input
// (only what the sink itself throws, or std::bad_alloc, leaves it).
Diagnosis convert(FileKind kind, const Input& input, DocumentSink& sink);
// What convert() would find, without writing the document.
Diagnosis diagnose(FileKind kind, const Input& input);

} // namespace OrvexKavorCore
