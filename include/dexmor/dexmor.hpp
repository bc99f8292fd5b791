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
// not read; a file that cannot be opened or read in full gives nothing, and the
// result says so.
#include <dexmor/archive/ReadFailure.hpp>
#include <dexmor/version.hpp>

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

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
    // Called between pieces of the document (about every 64 KiB of text, whether
    // or not the sink has a wholeText()). A sink may throw from here to stop the
    // conversion, say on a pending interrupt; the exception leaves convert().
    virtual void checkpoint() {}
};

// Appends the document to a string.
class StringSink : public DocumentSink {
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

// Writes the document to a file that takes the place of `target` with commit():
// until then it is an unnamed file where the file system has them (nothing is
// left behind even when the process is killed), else a temporary file beside the
// target. Without a successful commit the target is left as it was.
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

    // For a program that owns its signals (a command-line tool): installs handlers
    // for SIGINT, SIGTERM and SIGHUP that remove the temporary files of unfinished
    // sinks, then end the process as the signal would have.
    static void removeTemporariesOnSignals();

private:
    std::unique_ptr<AtomicFileWriter> file_;
    std::size_t written_ = 0;
};

// A material of a library as its document shows it.
struct MaterialSummary {
    std::string name;
    std::string kind; // "layered material"
    // The url of the material's own asset; none when it folds into no asset (a
    // multi, single-BRDF or instance material).
    std::optional<std::string> assetUrl;
};

// What a conversion found, from the reading that converted the file.
struct Diagnosis {
    bool opened = false;        // false: the file cannot be opened or read in full; nothing was written
    int openError = 0;          // then the errno that says why (ENOENT, EACCES, EISDIR, EINVAL, EIO)
    bool readsAsBinary = false; // the document was written; otherwise the pass-through text
    // When it reads as binary: "material library, generation 3, 12 materials" or
    // "render options, version 23".
    std::string description;
    // Otherwise: the first failure the readers recorded, and the length in bytes
    // (UTF-8) of the pass-through text written instead.
    std::optional<ReadFailure> failure;
    std::size_t fallbackLength = 0;
    // Set when the XML would have exceeded the output budget of this many bytes:
    // the conversion stopped there, and what the sink received is no document (a
    // sink that can take its text back has dropped it).
    std::optional<std::uint64_t> exceededBudget;

    // With ConversionOptions::survey, what the document holds: a library's
    // materials in order, an options document's settings assets (their urls), and
    // the warnings of its lint: an asset url given to several assets, a plugin
    // reference that names no asset of the document, a url holding a character
    // XML 1.0 cannot carry. Each warning names the material ("material 3 "Oak":
    // the url "/Wood_" is given to 2 assets").
    std::vector<MaterialSummary> materials;
    std::vector<std::string> settings;
    std::vector<std::string> warnings;

    // Whether the sink received a whole document: the XML or the pass-through text.
    bool complete() const { return opened && !exceededBudget; }

    // Why the file does not read as binary, for a user: the failure with its record
    // path and offset, why the file cannot be opened or read, or the budget the XML
    // would have exceeded.
    std::string reason() const;
};

struct ConversionOptions {
    // The output budget: the most bytes a document may have. nullopt: the larger
    // of 256 MiB and 1,000 times the input's size (a legitimate library gives some
    // twenty times its size; a hostile one can ask for far more than that: its
    // names are repeated in every url beneath them). 0: no limit.
    std::optional<std::uint64_t> maxOutput;
    // Whether a file that does not read as binary sends its text to the sink (the
    // result tells its length either way); false for a caller that treats such a
    // file as an error.
    bool passThrough = true;
    // Whether to fill in the Diagnosis's survey of the document (materials,
    // settings, warnings); it costs a look at every line.
    bool survey = false;
    // The wrapped form, for XML tools: an XML declaration and one root element,
    // <AssetDocument kind="zelmat"> (or "zelopt"), around the document's <Assets>
    // blocks, and U+FFFD for each character XML 1.0 cannot carry (the survey's
    // lint names where they were), so that the document is well-formed XML 1.0
    // whatever the file holds. A file passed through as text gives its text,
    // escaped, as the one <passedThrough> element of that root. The plain form
    // (false) is the document as it has always been written: a library's blocks
    // one after another, every character as the file gave it.
    bool wrap = false;

    // The budget for an input of `inputSize` bytes; 0 for none.
    std::uint64_t outputBudgetFor(std::uint64_t inputSize) const;
};

// Converts `input` as a file of `kind` into `sink`. Never throws for any input
// (only what the sink itself throws, std::bad_alloc, or std::system_error when
// no thread can be had for a deep conversion, leaves it). Any depth of
// nesting the reader accepts converts on any thread: a conversion that finds too
// little stack left on the calling thread runs on a thread of its own.
Diagnosis convert(FileKind kind, const Input& input, DocumentSink& sink, const ConversionOptions& options = {});
// What convert() would find, without writing the document.
Diagnosis diagnose(FileKind kind, const Input& input);

} // namespace OrvexKavorCore

// dexmor explain: every byte of a file, named.
#include <dexmor/files/Explanation.hpp>
