// Throughput of reading records from a file's bytes and of the whole conversion
// from bytes to XML, for a material library and a render-options file.
#include "BenchCorpus.hpp"
#include "../fuzz/HostileShapes.hpp"

#include <dexmor/dexmor.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>

#include <benchmark/benchmark.h>

#include <cstdint>
#include <map>
#include <string>

using namespace OrvexKavorCore;

namespace {

constexpr std::size_t kMaterials = 1000;

// A library like the benchmark files, and options with varied settings.
const std::string& libraryFile() {
    static const std::string bytes = [] {
        ZelMatFile library = bench::makeLibrary(kMaterials, 20240611);
        return bench::libraryBytes(library);
    }();
    return bytes;
}

const std::string& optionsFile() {
    static const std::string bytes = [] {
        AllOptions options = bench::makeOptions(20240611);
        return bench::optionsBytes(options);
    }();
    return bytes;
}

// Bytes per second of the file read.
void BM_ReadLibrary(benchmark::State& state) {
    const std::string& bytes = libraryFile();
    for (auto _ : state) {
        ZelMatFile file;
        if (!file.readFromBytes(bytes)) state.SkipWithError("the library does not read");
        benchmark::DoNotOptimize(file.materials.data());
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * bytes.size()));
    state.counters["materials"] =
        benchmark::Counter(double(state.iterations() * kMaterials), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_ReadLibrary)->Unit(benchmark::kMillisecond);

// The whole conversion of a file's bytes; bytes per second of XML made.
void convert(benchmark::State& state, FileKind kind, const std::string& bytes) {
    std::size_t made = 0;
    for (auto _ : state) {
        std::string xml;
        StringSink sink(xml);
        OrvexKavorCore::convert(kind, Input::ofBytes(bytes), sink);
        made += xml.size();
        benchmark::DoNotOptimize(xml.data());
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(made));
}

void BM_ConvertLibrary(benchmark::State& state) {
    convert(state, FileKind::MaterialLibrary, libraryFile());
    state.counters["materials"] =
        benchmark::Counter(double(state.iterations() * kMaterials), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_ConvertLibrary)->Unit(benchmark::kMillisecond);

// The streamed conversion of libraries of 1,000 to 100,000 materials, as
// `dexmor xml` runs it, its text counted and dropped: the time per material
// shows whether the conversion scales linearly, without the start of a process.
// The second argument 0 lifts the output budget, to show what checking it costs.
void BM_StreamLibrary(benchmark::State& state) {
    const auto materials = static_cast<std::size_t>(state.range(0));
    static std::map<std::size_t, SharedBytes> libraries;
    auto found = libraries.find(materials);
    if (found == libraries.end()) {
        ZelMatFile library = bench::makeLibrary(materials, 20240611);
        found = libraries.emplace(materials, SharedBytes::adopt(bench::libraryBytes(library))).first;
    }
    std::size_t made = 0;
    CallbackSink counted([&made](std::string_view piece) { made += piece.size(); });
    ConversionOptions options;
    if (state.range(1) == 0) options.maxOutput = 0;
    for (auto _ : state)
        OrvexKavorCore::convert(FileKind::MaterialLibrary, Input::ofBytes(found->second.view()), counted, options);
    state.SetBytesProcessed(static_cast<std::int64_t>(made));
    state.counters["per_material"] = benchmark::Counter(double(state.iterations() * materials),
                                                        benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(BM_StreamLibrary)
    ->ArgNames({"materials", "budget"})
    ->ArgsProduct({{1000, 10000, 100000}, {1}})
    ->Args({100000, 0})
    ->Unit(benchmark::kMillisecond);

// One material of 50,000 layers, streamed in pieces as `dexmor xml` sends it
// (never held whole) or written into one string (argument 0): what streaming
// within a material costs.
void BM_OneLargeMaterial(benchmark::State& state) {
    static const std::string bytes = [] {
        const ConversionContext context;
        return hostile::libraryOf(hostile::amplifier(8, 50000, [] { return boost::make_shared<Diffuse_BRDF>(); }));
    }();
    std::size_t made = 0;
    std::string xml;
    CallbackSink counted([&made](std::string_view piece) { made += piece.size(); });
    for (auto _ : state) {
        if (state.range(0) == 1) {
            OrvexKavorCore::convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), counted);
        } else {
            xml.clear();
            StringSink whole(xml);
            OrvexKavorCore::convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), whole);
            made += xml.size();
        }
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(made));
}
BENCHMARK(BM_OneLargeMaterial)->ArgName("streamed")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);

void BM_ReadOptions(benchmark::State& state) {
    const std::string& bytes = optionsFile();
    for (auto _ : state) {
        AllOptions options;
        if (!ZelOptFile().readBytes(options, bytes)) state.SkipWithError("the options do not read");
        benchmark::DoNotOptimize(&options);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * bytes.size()));
}
BENCHMARK(BM_ReadOptions)->Unit(benchmark::kMicrosecond);

void BM_ConvertOptions(benchmark::State& state) { convert(state, FileKind::RenderOptions, optionsFile()); }
BENCHMARK(BM_ConvertOptions)->Unit(benchmark::kMicrosecond);

} // namespace
