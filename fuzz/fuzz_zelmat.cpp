// Fuzz target: the whole conversion of a material library (".zelmat") from the
// bytes of a file in memory (reading, then the XML document or the pass-through
// text), and the diagnosis that `dexmor check` reports for the same bytes.
// Whatever the bytes, both must return without a crash, a leak, undefined
// behaviour, a hang or memory out of proportion to the input, and must agree.
// The conversion into one string, or into a destination that can drop what it
// was sent, reads each material once; streamed, it reads the library twice: all
// must give the same text.
#include "archive/Conversion.hpp"
#include "archive/ZelMatFile.hpp"
#include "textures/SkyTexture.hpp"

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

using namespace OrvexKavorCore;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    const std::string xml = convertBytesToXml(FileKind::MaterialLibrary, bytes);
    const Diagnosis diagnosis = diagnoseBytes(FileKind::MaterialLibrary, bytes);
    // The diagnosis tells what the conversion returns instead of XML, to the byte.
    if (!diagnosis.readsAsBinary && diagnosis.fallbackLength != xml.size()) {
        std::fprintf(stderr, "the diagnosis announces %zu bytes of pass-through text, the conversion gives %zu\n",
                     diagnosis.fallbackLength, xml.size());
        std::abort();
    }
    std::string streamed;
    resetSharedDefaultSun();
    ZelMatFile().bytesToXml(SharedBytes::copyOf(bytes),
                            [&streamed](std::string_view piece) { streamed.append(piece); });
    // Into a destination that drops what it was sent on request, as the tool's
    // temporary files do, the library is read once too.
    std::string dropping;
    ZelMatFile().bytesToXml(
        SharedBytes::copyOf(bytes), [&dropping](std::string_view piece) { dropping.append(piece); },
        [&dropping] { dropping.clear(); });
    if (streamed != xml || dropping != xml) {
        std::fprintf(stderr, "the conversions differ: whole %zu, streamed %zu, taken back %zu bytes\n", xml.size(),
                     streamed.size(), dropping.size());
        std::abort();
    }
    return 0;
}
