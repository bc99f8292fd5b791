// The one conversion both front ends call: convert() and diagnose() over a file
// or bytes, into a DocumentSink.
#include <dexmor/dexmor.hpp>

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/platform/Text.hpp>

#include "files/DocumentSurvey.hpp"
#include "files/Explainer.hpp"
#include "files/LibraryConversion.hpp"
#include "files/OptionsConversion.hpp"
#include "files/SinkWriter.hpp"
#include "xml/XmlCharacters.hpp"
#include "platform/FileIo.hpp"
#include "platform/HugePages.hpp"
#include "platform/Stack.hpp"

#include <algorithm>
#include <limits>
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
    if (!opened) return "the file " + (failure ? failure->reason : std::string("cannot be opened"));
    if (exceededBudget) return "the XML would exceed " + std::to_string(*exceededBudget) + " bytes (the output budget)";
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

void AtomicFileSink::removeTemporariesOnSignals() { OrvexKavorCore::removeTemporariesOnSignals(); }

// --- conversion ---

namespace {

// Bytes an archive cannot hold: a file larger than this, whatever its kind, does
// not read as binary, and only its text up to the first NUL is read.
constexpr std::uint64_t kLargestBinaryFile = QuickArchive::kMaxSize + 12;

// Stack a conversion may need: records nest up to the reader's limit, and each
// level costs the reading and the writing a few frames. The deepest chains of the
// nested kinds take about 140 KiB (about 1 MiB under the address sanitizer, whose
// frames are larger); a thread with less than this left hands the conversion to
// a thread of its own, so the usual 8 MiB main thread never does.
#if defined(__SANITIZE_ADDRESS__)
#define DEXMOR_LARGE_FRAMES 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define DEXMOR_LARGE_FRAMES 1
#endif
#endif
#ifdef DEXMOR_LARGE_FRAMES
constexpr std::size_t kConversionStack = std::size_t{4} << 20;
#else
constexpr std::size_t kConversionStack = std::size_t{1} << 20;
#endif

struct InputBytes {
    SharedBytes bytes;
    bool overLimit = false; // the bytes are only the text of a file too large to read as binary
};

// The bytes of the input: a file read once, or the caller's bytes viewed in place.
std::optional<InputBytes> bytesOf(const Input& input, FileError& error) {
    if (const std::string_view* bytes = input.bytes()) {
        if (bytes->size() <= kLargestBinaryFile) return InputBytes{SharedBytes({}, *bytes), false};
        return InputBytes{SharedBytes({}, text::upToFirstNul(*bytes)), true};
    }
    std::optional<FileContent> content = readRegularFile(*input.path(), &error, kLargestBinaryFile);
    if (!content) return std::nullopt;
    return InputBytes{std::move(content->bytes), content->overLimit};
}

Diagnosis unopened(FileError why) {
    Diagnosis result;
    result.failure = ReadFailure{std::move(why.message), 0, {}};
    result.openError = why.number;
    return result;
}

Diagnosis tooLargeForAnArchive() {
    Diagnosis result;
    result.failure = ReadFailure{"the file is larger than the 4 GiB an archive can hold", 0, {"header"}};
    return result;
}

// The pass-through text: the bytes taken to be XML text already, up to the first NUL.
std::string passThroughText(const SharedBytes& bytes) {
    return text::decodeStoredText(text::upToFirstNul(bytes.view()));
}

// Hands the conversion of `bytes` as a file of `kind` to `use`, on a stack deep
// enough for any nesting the readers accept.
template <class Use>
Diagnosis withConversion(FileKind kind, const InputBytes& input, std::uint64_t budget, DocumentSurvey* survey,
                         bool wrap, Use use) {
    if (input.overLimit) return tooLargeForAnArchive();
    Diagnosis result;
    runWithStack(kConversionStack, [&] {
        ConversionContext context;
        result = kind == FileKind::MaterialLibrary
                     ? use(LibraryConversion(context, input.bytes, budget, survey, wrap))
                     : use(OptionsConversion(input.bytes, budget, survey, wrap));
    });
    return result;
}

// The pass-through text in the wrapped form: the root around one <passedThrough>
// element holding the text, escaped and carried (see XmlCarrier). It is sent in
// pieces of bounded size, and only once its whole size fits the budget.
void sendWrappedText(DocumentSink& sink, FileKind kind, std::string_view text, std::uint64_t budget) {
    const std::string start = wrappedDocumentStart(kind) + "<passedThrough>";
    constexpr std::string_view kEnd = "</passedThrough>\n";
    const auto eachPiece = [&](const auto& take) {
        take(start);
        std::string escaped, piece;
        XmlCarrier carrier;
        for (std::size_t at = 0; at < text.size();) {
            // Runs end between characters (the text is UTF-8).
            std::size_t end = std::min(text.size(), at + SinkWriter::kPieceSize);
            while (end < text.size() && (static_cast<unsigned char>(text[end]) & 0xC0) == 0x80) ++end;
            escaped.clear();
            appendEscaped(escaped, text.substr(at, end - at));
            piece.clear();
            carrier.append(piece, escaped, true);
            take(piece);
            at = end;
        }
        take(kEnd);
        take(kWrappedDocumentEnd);
    };
    if (budget != 0) {
        std::uint64_t size = 0;
        eachPiece([&size](std::string_view piece) { size += piece.size(); });
        if (size > budget) throw OutputBudgetExceeded{budget};
    }
    eachPiece([&sink](std::string_view piece) {
        sink.write(piece);
        sink.checkpoint();
    });
}

} // namespace

std::uint64_t ConversionOptions::outputBudgetFor(std::uint64_t inputSize) const {
    if (maxOutput) return *maxOutput;
    constexpr std::uint64_t kFloor = std::uint64_t{256} << 20;
    constexpr std::uint64_t kTimesInput = 1000;
    const std::uint64_t most = std::numeric_limits<std::uint64_t>::max();
    return std::max(kFloor, inputSize > most / kTimesInput ? most : inputSize * kTimesInput);
}

Diagnosis convert(FileKind kind, const Input& input, DocumentSink& sink, const ConversionOptions& options) {
    FileError error;
    const std::optional<InputBytes> bytes = bytesOf(input, error);
    if (!bytes) return unopened(std::move(error));
    const std::uint64_t budget = options.outputBudgetFor(bytes->bytes.size());
    Diagnosis result;
    DocumentSurvey survey;
    try {
        result = withConversion(kind, *bytes, budget, options.survey ? &survey : nullptr, options.wrap,
                                [&sink](auto&& conversion) { return conversion.writeTo(sink); });
        if (options.survey && result.readsAsBinary) {
            result.materials = survey.materials();
            result.settings = survey.settingsAssets();
            result.warnings = survey.warnings();
        }
        if (!result.readsAsBinary) {
            const std::string text = passThroughText(bytes->bytes);
            result.fallbackLength = text.size();
            if (options.passThrough && options.wrap) {
                sendWrappedText(sink, kind, text, budget);
            } else if (options.passThrough) {
                if (budget != 0 && text.size() > budget) throw OutputBudgetExceeded{budget};
                sink.write(text);
            }
        }
    } catch (const OutputBudgetExceeded& exceeded) {
        if (sink.canTakeBack()) sink.takeBack();
        result.exceededBudget = exceeded.budget;
    }
    result.opened = true;
    return result;
}

Explanation explain(FileKind kind, const Input& input) {
    Explanation result;
    FileError error;
    const std::optional<InputBytes> bytes = bytesOf(input, error);
    if (!bytes) {
        result.failure = unopened(std::move(error)).failure;
        result.openError = error.number;
        return result;
    }
    if (bytes->overLimit) {
        result.opened = true;
        result.failure = tooLargeForAnArchive().failure;
        result.root.kind = "file";
        return result;
    }
    runWithStack(kConversionStack, [&] {
        ConversionContext context;
        result = explainBytes(kind, bytes->bytes);
    });
    return result;
}

Diagnosis diagnose(FileKind kind, const Input& input) {
    FileError error;
    const std::optional<InputBytes> bytes = bytesOf(input, error);
    if (!bytes) return unopened(std::move(error));
    Diagnosis result =
        withConversion(kind, *bytes, 0, nullptr, false, [](auto&& conversion) { return conversion.readThrough(); });
    if (!result.readsAsBinary) result.fallbackLength = passThroughText(bytes->bytes).size();
    result.opened = true;
    return result;
}

} // namespace OrvexKavorCore
