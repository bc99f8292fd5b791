// Fuzz target: the whole conversion of a render-options file (".zelopt") from the
// bytes of a file in memory (reading, then the XML document or the pass-through
// text), and the diagnosis that `dexmor check` reports for the same bytes.
// Whatever the bytes, both must return without a crash, a leak, undefined
// behaviour, a hang or memory out of proportion to the input, and must agree.
#include <dexmor/dexmor.hpp>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

using namespace OrvexKavorCore;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    std::string xml;
    StringSink sink(xml);
    convert(FileKind::RenderOptions, Input::ofBytes(bytes), sink);
    const Diagnosis diagnosis = diagnose(FileKind::RenderOptions, Input::ofBytes(bytes));
    // The diagnosis tells what the conversion returns instead of XML, to the byte.
    if (!diagnosis.readsAsBinary && diagnosis.fallbackLength != xml.size()) {
        std::fprintf(stderr, "the diagnosis announces %zu bytes of pass-through text, the conversion gives %zu\n",
                     diagnosis.fallbackLength, xml.size());
        std::abort();
    }
    return 0;
}
