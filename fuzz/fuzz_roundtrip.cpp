// Fuzz target: whatever reads must write and read back unchanged.
//
// The bytes are read as a material library and as render options. When a read
// succeeds, the object is written, the written bytes are read into a second
// object, and the second object is written again. Both must succeed, the two
// objects must be equal (isEqual) and the two writes must give the same bytes:
// a field lost or corrupted on the way through a file is a fault, and the target
// aborts with a description of the difference.
//
// Equality is only required of objects that equal themselves: a NaN stored in a
// float field is unequal to itself, and two instance materials are never equal.
// Their round trip is still checked byte for byte.
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/textures/SkyTexture.hpp>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <sstream>
#include <string>
#include <string_view>
#include <vector>

using namespace OrvexKavorCore;

namespace {

[[noreturn]] void fault(const std::string& what) {
    std::fprintf(stderr, "round trip fault: %s\n", what.c_str());
    std::fflush(stderr);
    std::abort();
}

std::string failureText(const std::optional<ReadFailure>& failure) {
    return failure ? failure->describe() : std::string("no reason recorded");
}

// The offset of the first byte where two byte strings differ.
std::size_t firstDifference(std::string_view a, std::string_view b) {
    std::size_t i = 0;
    while (i < a.size() && i < b.size() && a[i] == b[i]) ++i;
    return i;
}

void requireSameBytes(const char* what, const std::string& first, const std::string& second) {
    if (first == second) return;
    fault(std::string(what) + ": the second write differs from the first at byte " +
          std::to_string(firstDifference(first, second)) + " (lengths " + std::to_string(first.size()) + " and " +
          std::to_string(second.size()) + ")");
}

// --- material libraries ---

std::string writeLibrary(ZelMatFile& file, const char* which) {
    std::ostringstream out;
    if (!file.writeToStream(out)) fault(std::string("material library: the ") + which + " write failed: " + file.lastError());
    return std::move(out).str();
}

// The index of the first material that differs, or -1.
long firstUnequalMaterial(const std::vector<MaterialPtr>& a, const std::vector<MaterialPtr>& b) {
    for (std::size_t i = 0; i < a.size() && i < b.size(); ++i)
        if (!a[i]->isEqual(b[i])) return static_cast<long>(i);
    return a.size() == b.size() ? -1 : static_cast<long>(std::min(a.size(), b.size()));
}

void roundTripLibrary(std::string_view bytes) {
    const ConversionContext fresh1;
    ZelMatFile first;
    if (!first.readFromBytes(bytes)) return;
    const std::string written = writeLibrary(first, "first");

    const ConversionContext fresh2;
    ZelMatFile second;
    if (!second.readFromBytes(written))
        fault("material library: the written bytes do not read: " + failureText(second.lastReadFailure()));
    const std::string rewritten = writeLibrary(second, "second");

    requireSameBytes("material library", written, rewritten);
    const long unequal = firstUnequalMaterial(first.materials, second.materials);
    if (unequal >= 0 && firstUnequalMaterial(first.materials, first.materials) < 0)
        fault("material library: material " + std::to_string(unequal) + " reads back unequal");
}

// --- render options ---

std::string writeOptions(AllOptions& options, const char* which) {
    QuickArchive ar(1);
    if (!options.writeToArchive(ar)) fault(std::string("render options: the ") + which + " write failed");
    // As ZelOptFile::writeFile stores it: every chunk in full.
    std::string image;
    for (const auto& chunk : ar.chunks())
        image.append(reinterpret_cast<const char*>(chunk->data()), QuickArchive::kChunkSize);
    return image;
}

void roundTripOptions(std::string_view bytes) {
    const ConversionContext fresh3;
    ZelOptFile file;
    AllOptions first;
    if (!file.readBytes(first, bytes)) return;
    const std::string written = writeOptions(first, "first");

    const ConversionContext fresh4;
    AllOptions second;
    if (!file.readBytes(second, written))
        fault("render options: the written bytes do not read: " + failureText(file.lastReadFailure()));
    const std::string rewritten = writeOptions(second, "second");

    requireSameBytes("render options", written, rewritten);
    if (!first.isEqual(second) && first.isEqual(first)) {
        const char* field = first.firstDifference(second);
        fault(std::string("render options: field ") + (field ? field : "?") + " reads back unequal");
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    roundTripLibrary(bytes);
    roundTripOptions(bytes);
    return 0;
}
