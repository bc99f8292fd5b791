// Fuzz target: the whole conversion of a material library (".zelmat") from the
// bytes of a file in memory (reading, then the XML document or the pass-through
// text), and the diagnosis that `dexmor check` reports for the same bytes.
// Whatever the bytes, both must return without a crash, a leak, undefined
// behaviour, a hang or memory out of proportion to the input, and must agree.
// The conversion into one string, or into a destination that can drop what it
// was sent, reads each material once; streamed, it reads the library twice: all
// must give the same text, or both stop at the same output budget (smaller here
// than the default, so that amplifying inputs stay quick to run).
#include <dexmor/dexmor.hpp>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <string_view>

using namespace OrvexKavorCore;

namespace {

// The document as a destination that can take back what it was sent gets it
// (the library read once), or as one that cannot (read twice); nullopt when it
// would exceed the budget.
std::optional<std::string> converted(std::string_view bytes, bool canTakeBack) {
    std::string xml;
    StringSink whole(xml);
    CallbackSink streamed([&xml](std::string_view piece) { xml.append(piece); });
    DocumentSink& sink = canTakeBack ? static_cast<DocumentSink&>(whole) : streamed;
    const ConversionOptions budget{std::uint64_t{1} << 22};
    const Diagnosis result = convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink, budget);
    if (result.exceededBudget) {
        if (canTakeBack && !xml.empty()) {
            std::fprintf(stderr, "a sink that can take back its text keeps %zu bytes past the budget\n", xml.size());
            std::abort();
        }
        if (xml.size() > *budget.maxOutput) {
            std::fprintf(stderr, "%zu bytes were sent past a budget of %zu\n", xml.size(), std::size_t{*budget.maxOutput});
            std::abort();
        }
        return std::nullopt;
    }
    return xml;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    const std::optional<std::string> xml = converted(bytes, true);
    const Diagnosis diagnosis = diagnose(FileKind::MaterialLibrary, Input::ofBytes(bytes));
    // The diagnosis tells what the conversion returns instead of XML, to the byte.
    if (xml && !diagnosis.readsAsBinary && diagnosis.fallbackLength != xml->size()) {
        std::fprintf(stderr, "the diagnosis announces %zu bytes of pass-through text, the conversion gives %zu\n",
                     diagnosis.fallbackLength, xml->size());
        std::abort();
    }
    // Read once or twice, the document is the same to the byte.
    const std::optional<std::string> streamed = converted(bytes, false);
    if (streamed != xml) {
        std::fprintf(stderr, "the conversions differ: read once %zu, read twice %zu bytes\n",
                     xml ? xml->size() : 0, streamed ? streamed->size() : 0);
        std::abort();
    }
    return 0;
}
