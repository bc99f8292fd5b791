// Throughput of the asset document writer and of float formatting.
#include <dexmor/xml/AssetXmlWriter.hpp>
#include "xml/NumberFormat.hpp"

#include <benchmark/benchmark.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

using namespace OrvexKavorCore;

namespace {

constexpr int kAssets = 2500;
constexpr int kFloatsPerAsset = 40;  // 100,000 float parameters in all
constexpr int kColorsPerAsset = 40;  // 100,000 colour parameters in all

// Values as stored files hold them: half short ones that a user typed (0.5, 2.2),
// half the results of arithmetic that use every digit (0.7231548).
std::vector<float> sampleFloats(std::size_t count) {
    std::mt19937 random(20240611);
    std::uniform_real_distribution<float> unit(0.0f, 1.0f);
    std::uniform_int_distribution<int> tenths(0, 100);
    std::vector<float> values(count);
    for (std::size_t i = 0; i < count; ++i)
        values[i] = i % 2 ? unit(random) * 100.0f : static_cast<float>(tenths(random)) / 10.0f;
    return values;
}

struct Document {
    std::vector<std::string> urls;
    std::vector<std::string> floatNames, colorNames;
    std::vector<float> floats;
    std::vector<Color> colors;
};

Document makeDocument() {
    Document doc;
    for (int a = 0; a < kAssets; ++a) doc.urls.push_back("/Material " + std::to_string(a));
    for (int p = 0; p < kFloatsPerAsset; ++p) doc.floatNames.push_back("float_param_" + std::to_string(p));
    for (int p = 0; p < kColorsPerAsset; ++p) doc.colorNames.push_back("color_param_" + std::to_string(p));
    doc.floats = sampleFloats(std::size_t(kAssets) * kFloatsPerAsset);
    const std::vector<float> channels = sampleFloats(std::size_t(kAssets) * kColorsPerAsset * 3);
    for (std::size_t i = 0; i < channels.size(); i += 3)
        doc.colors.push_back(Color{channels[i] / 100.0f, channels[i + 1] / 100.0f, channels[i + 2] / 100.0f});
    return doc;
}

void writeDocument(const Document& doc, std::string& out) {
    AssetXmlWriter writer(out);
    writer.beginDocument();
    std::size_t f = 0, c = 0;
    for (const std::string& url : doc.urls) {
        writer.beginAsset(url, "material", "defkvmat");
        writer.beginPlugin("MtlSingleBRDF", "material");
        writer.beginParameters();
        for (const std::string& name : doc.floatNames) writer.writeFloat(name, doc.floats[f++]);
        for (const std::string& name : doc.colorNames) writer.writeColor(name, doc.colors[c++]);
        writer.endParameters();
        writer.endPlugin();
        writer.endAsset();
    }
    writer.endDocument();
}

// Arg 0: a fresh string each time, growing as a conversion's does (page faults
// and copies of the growth included). Arg 1: the string of the previous run
// reused, so only the writer's own work is measured.
void BM_WriteDocument(benchmark::State& state) {
    const Document doc = makeDocument();
    const bool reuse = state.range(0) != 0;
    std::string kept;
    std::size_t bytes = 0;
    for (auto _ : state) {
        std::string fresh;
        std::string& out = reuse ? kept : fresh;
        out.clear();
        writeDocument(doc, out);
        bytes += out.size();
        benchmark::DoNotOptimize(out.data());
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(bytes));
    state.counters["parameters"] = double(doc.floats.size() + doc.colors.size());
}
BENCHMARK(BM_WriteDocument)->ArgName("reuse")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);

void BM_FormatFloat(benchmark::State& state) {
    const std::vector<float> values = sampleFloats(4096);
    std::string out;
    std::size_t bytes = 0;
    for (auto _ : state) {
        out.clear();
        for (float value : values) appendFloat(out, value);
        bytes += out.size();
        benchmark::DoNotOptimize(out.data());
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(state.iterations() * values.size()));
    state.SetBytesProcessed(static_cast<std::int64_t>(bytes));
}
BENCHMARK(BM_FormatFloat);

} // namespace
