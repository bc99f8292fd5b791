// The one conversion both front ends call: convert() and diagnose() over a file
// or bytes, into a DocumentSink.
#include <dexmor/dexmor.hpp>

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/platform/Text.hpp>

#include "files/LibraryConversion.hpp"
#include "files/OptionsConversion.hpp"
#include "platform/FileIo.hpp"
#include "platform/HugePages.hpp"

#include <new>

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

std::string Diagnosis::reason() const {
    if (!opened) return "the file cannot be opened";
    return failure ? failure->describe() : std::string("no reason was recorded");
}

// --- sinks ---

void StringSink::expect(std::size_t bytes) {
    // Only a hint: when the room cannot be had, the text grows as it goes.
    try {
        reserveForAppend(document_, bytes);
    } catch (const std::bad_alloc&) {
    }
}

AtomicFileSink::AtomicFileSink(std::filesystem::path target)
    : file_(std::make_unique<AtomicFileWriter>(std::move(target))) {}

AtomicFileSink::~AtomicFileSink() = default;

void AtomicFileSink::write(std::string_view piece) {
    if (file_->append(piece)) written_ += piece.size();
}

void AtomicFileSink::takeBack() {
    file_->discard();
    written_ = 0;
}

bool AtomicFileSink::commit(std::string* error) { return file_->commit(error); }

// --- conversion ---

namespace {

// The bytes of the input: a file read once, or the caller's bytes viewed in place.
std::optional<SharedBytes> bytesOf(const Input& input) {
    if (const std::string_view* bytes = input.bytes()) return SharedBytes({}, *bytes);
    return readRegularFile(*input.path());
}

Diagnosis unopened() {
    Diagnosis result;
    result.failure = ReadFailure{"the file cannot be opened", 0, {}};
    return result;
}

// The length of the pass-through text: the bytes taken to be XML text already,
// up to the first NUL.
std::string passThroughText(const SharedBytes& bytes) {
    return text::decodeStoredText(text::upToFirstNul(bytes.view()));
}

template <class Read>
Diagnosis withFileKind(FileKind kind, const Input& input, Read read) {
    const std::optional<SharedBytes> bytes = bytesOf(input);
    if (!bytes) return unopened();
    ConversionContext context;
    Diagnosis result = kind == FileKind::MaterialLibrary ? read(LibraryConversion(context, *bytes), *bytes)
                                                         : read(OptionsConversion(*bytes), *bytes);
    result.opened = true;
    return result;
}

} // namespace

Diagnosis convert(FileKind kind, const Input& input, DocumentSink& sink) {
    return withFileKind(kind, input, [&sink](auto&& conversion, const SharedBytes& bytes) {
        Diagnosis result = conversion.writeTo(sink);
        if (!result.readsAsBinary) {
            const std::string text = passThroughText(bytes);
            result.fallbackLength = text.size();
            sink.write(text);
        }
        return result;
    });
}

Diagnosis diagnose(FileKind kind, const Input& input) {
    return withFileKind(kind, input, [](auto&& conversion, const SharedBytes& bytes) {
        Diagnosis result = conversion.readThrough();
        if (!result.readsAsBinary) result.fallbackLength = passThroughText(bytes).size();
        return result;
    });
}

} // namespace OrvexKavorCore
