// Writes the files the benchmark script converts:
//   make_bench_files [--libraries N,N,...] [--files N] OUTDIR
// OUTDIR/library-N.zelmat for each N (by default 1000, 10000 and 100000
// materials) and OUTDIR/files/ with N small files (by default 5,000): four in
// five are material libraries of 1 to 20 materials, one in five render-options
// files; the folder is emptied first. OUTDIR/complete is written last and lists
// what was made, so that a caller can tell a finished set from an interrupted one.
#include "BenchCorpus.hpp"

#include <dexmor/files/ZelOptFile.hpp>
#include "platform/FileIo.hpp"

#include <charconv>
#include <cstdio>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace fs = std::filesystem;
using namespace OrvexKavorCore;

namespace {

constexpr std::uint32_t kSeed = 20240611;

bool parseCount(std::string_view text, std::size_t& out) {
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), out);
    return error == std::errc() && end == text.data() + text.size() && out > 0;
}

bool parseCounts(std::string_view text, std::vector<std::size_t>& out) {
    out.clear();
    while (!text.empty()) {
        const std::size_t comma = text.find(',');
        std::size_t count = 0;
        if (!parseCount(text.substr(0, comma), count)) return false;
        out.push_back(count);
        text = comma == std::string_view::npos ? std::string_view() : text.substr(comma + 1);
    }
    return !out.empty();
}

std::string numbered(std::size_t i, std::size_t width) {
    std::string digits = std::to_string(i);
    return std::string(digits.size() < width ? width - digits.size() : 0, '0') + digits;
}

bool writeLibrary(ZelMatFile& library, const fs::path& path) {
    if (library.save(path)) return true;
    std::fprintf(stderr, "make_bench_files: %s: %s\n", path.string().c_str(), library.lastError().c_str());
    return false;
}

int usage() {
    std::fprintf(stderr, "usage: make_bench_files [--libraries N,N,...] [--files N] OUTDIR\n");
    return 2;
}

} // namespace

int main(int argc, char** argv) {
    std::vector<std::size_t> libraries{1000, 10000, 100000};
    std::size_t files = 5000;
    fs::path dir;
    for (int i = 1; i < argc; ++i) {
        const std::string_view arg = argv[i];
        if (arg == "--libraries" && i + 1 < argc) {
            if (!parseCounts(argv[++i], libraries)) return usage();
        } else if (arg == "--files" && i + 1 < argc) {
            if (!parseCount(argv[++i], files)) return usage();
        } else if (dir.empty() && !arg.starts_with("-")) {
            dir = arg;
        } else {
            return usage();
        }
    }
    if (dir.empty()) return usage();

    // The folder of small files is made anew, so that no file of an earlier, larger set stays.
    std::error_code error;
    fs::remove(dir / "complete", error);
    fs::remove_all(dir / "files", error);
    fs::create_directories(dir / "files", error);
    if (error) {
        std::fprintf(stderr, "make_bench_files: %s: %s\n", dir.string().c_str(), error.message().c_str());
        return 1;
    }

    std::string manifest = "libraries";
    for (std::size_t count : libraries) {
        // Each library has its own seed, so a library does not depend on the others made.
        ZelMatFile library = bench::makeLibrary(count, kSeed + static_cast<std::uint32_t>(count));
        const fs::path path = dir / ("library-" + std::to_string(count) + ".zelmat");
        if (!writeLibrary(library, path)) return 1;
        std::printf("%s: %zu materials\n", path.string().c_str(), count);
        manifest += " " + std::to_string(count);
    }

    const std::size_t width = std::to_string(files).size();
    for (std::size_t i = 1; i <= files; ++i) {
        const auto seed = kSeed + 7919u * static_cast<std::uint32_t>(i);
        if (i % 5 == 0) {
            AllOptions options = bench::makeOptions(seed);
            const fs::path path = dir / "files" / ("options-" + numbered(i, width) + ".zelopt");
            if (!ZelOptFile().writeFile(options, path)) {
                std::fprintf(stderr, "make_bench_files: %s cannot be written\n", path.string().c_str());
                return 1;
            }
        } else {
            const std::size_t count = 1 + (seed >> 3) % 20;
            ZelMatFile library = bench::makeLibrary(count, seed, "F" + numbered(i, width) + " ");
            if (!writeLibrary(library, dir / "files" / ("library-" + numbered(i, width) + ".zelmat"))) return 1;
        }
    }
    std::printf("%s: %zu files\n", (dir / "files").string().c_str(), files);

    manifest += "\nfiles " + std::to_string(files) + "\n";
    if (!writeFileAtomically(dir / "complete", manifest)) {
        std::fprintf(stderr, "make_bench_files: %s cannot be written\n", (dir / "complete").string().c_str());
        return 1;
    }
    return 0;
}
