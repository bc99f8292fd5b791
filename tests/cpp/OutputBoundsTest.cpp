// What a small hostile file can make a conversion produce, and what an unlucky
// moment does to it: the output budget, a document streamed in bounded pieces
// however large one material is, nesting at the limit on a small stack, and a
// file whose size lies.
#include "../../fuzz/HostileShapes.hpp"
#include "TestSupport.hpp"

#include <dexmor/dexmor.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <pthread.h>

using namespace OrvexKavorCore;
using namespace testsupport;
namespace fs = std::filesystem;

namespace {

BRDFPtr unnamedDiffuseLayer() {
    auto layer = boost::make_shared<Diffuse_BRDF>();
    layer->name.clear();
    return layer;
}

// What a destination that cannot take back its text received.
struct Received {
    std::string text;
    std::size_t largestPiece = 0;
    Diagnosis result;
};

Received streamed(std::string_view bytes, const ConversionOptions& options = {}) {
    Received received;
    CallbackSink sink([&](std::string_view piece) {
        received.text.append(piece);
        received.largestPiece = std::max(received.largestPiece, piece.size());
    });
    received.result = convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink, options);
    return received;
}

// The largest piece a streamed document is sent in: the writer's piece and one
// pending run of text.
constexpr std::size_t kLargestPiece = 64 * 1024 + 4096;

} // namespace

TEST(OutputBudget, AnAmplifyingLibraryStopsAtTheBudgetAndKeepsNothing) {
    // A 40 KB file whose document would be hundreds of megabytes.
    const std::string bytes = hostile::libraryOf(hostile::amplifier(20000, 400, unnamedDiffuseLayer));
    ASSERT_LT(bytes.size(), 100'000u);
    EXPECT_EQ(ConversionOptions{}.outputBudgetFor(bytes.size()), std::uint64_t{256} << 20);
    EXPECT_EQ(ConversionOptions{}.outputBudgetFor(std::uint64_t{1} << 20), std::uint64_t{1000} << 20);

    const ConversionOptions budget{std::uint64_t{4} << 20};
    const Received received = streamed(bytes, budget);
    EXPECT_EQ(received.result.exceededBudget, budget.maxOutput);
    EXPECT_EQ(received.result.reason(), "the XML would exceed 4194304 bytes (the output budget)");
    EXPECT_FALSE(received.result.complete());
    EXPECT_LE(received.text.size(), *budget.maxOutput); // nothing past the budget was sent
    EXPECT_LE(received.largestPiece, kLargestPiece);

    // A destination that can take its text back holds nothing of it.
    std::string xml = "kept";
    StringSink sink(xml);
    EXPECT_EQ(convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink, budget).exceededBudget, budget.maxOutput);
    EXPECT_EQ(xml, "kept");
}

TEST(OutputBudget, IsExactAndAppliesToEveryOutcome) {
    const std::string library = hostile::libraryOf(hostile::diffuseMaterial());
    const std::string xml = convertBytesToXml(FileKind::MaterialLibrary, library);
    const std::string text = "<Assets>not binary</Assets>";
    for (const auto& [bytes, size] : {std::pair{library, xml.size()}, std::pair{text, text.size()}}) {
        for (const bool streaming : {false, true}) {
            std::string out;
            StringSink whole(out);
            CallbackSink pieces([&out](std::string_view piece) { out.append(piece); });
            DocumentSink& sink = streaming ? static_cast<DocumentSink&>(pieces) : whole;
            // (A structured binding is named through an init-capture: clang 14 cannot capture one.)
            const auto run = [&, &input = bytes](std::uint64_t budget) {
                out.clear();
                return convert(FileKind::MaterialLibrary, Input::ofBytes(input), sink, {budget});
            };
            EXPECT_TRUE(run(size).complete()) << size;
            EXPECT_EQ(out.size(), size);
            EXPECT_EQ(run(size - 1).exceededBudget, size - 1);
            EXPECT_TRUE(run(0).complete()); // no limit
        }
    }
}

TEST(OutputBudget, OneHugeMaterialIsStreamedInBoundedPieces) {
    // Twenty thousand layers in one material: the document goes out as it is
    // written, never held whole.
    const std::string bytes = hostile::libraryOf(hostile::amplifier(8, 20000, unnamedDiffuseLayer));
    const Received received = streamed(bytes);
    ASSERT_TRUE(received.result.complete() && received.result.readsAsBinary);
    EXPECT_GT(received.text.size(), 100 * kLargestPiece);
    EXPECT_LE(received.largestPiece, kLargestPiece);
    EXPECT_EQ(received.text, convertBytesToXml(FileKind::MaterialLibrary, bytes));
}

TEST(SmallStacks, TheDeepestChainOfEveryNestedKindConvertsOnA128KiBThread) {
    for (const auto& chain : {hostile::deepestChain(hostile::bumpChain), hostile::deepestChain(hostile::textureChain)}) {
        ASSERT_TRUE(chain);
        const std::string bytes = hostile::libraryOf(chain);
        const std::string expected = convertBytesToXml(FileKind::MaterialLibrary, bytes);
        ASSERT_TRUE(expected.starts_with("<Assets>"));

        struct Work {
            const std::string* bytes;
            std::string xml;
        } work{&bytes, {}};
        pthread_attr_t attributes;
        ASSERT_EQ(::pthread_attr_init(&attributes), 0);
        ASSERT_EQ(::pthread_attr_setstacksize(&attributes, 128 * 1024), 0);
        pthread_t thread;
        const auto body = +[](void* argument) -> void* {
            auto& w = *static_cast<Work*>(argument);
            w.xml = convertBytesToXml(FileKind::MaterialLibrary, *w.bytes);
            return nullptr;
        };
        ASSERT_EQ(::pthread_create(&thread, &attributes, body, &work), 0);
        ::pthread_join(thread, nullptr);
        ::pthread_attr_destroy(&attributes);
        EXPECT_EQ(work.xml, expected);
    }
}

TEST(UnluckyMoments, AFileWhoseSizeLiesIsNotReadNotTakenForEmpty) {
    // A file of the process file system says it holds 0 bytes and delivers more:
    // as a file that changed while it was read, twice.
    const TempDir dir;
    const fs::path link = dir.path() / "lies.zelmat";
    fs::create_symlink("/proc/self/status", link);
    std::string xml;
    StringSink sink(xml);
    const Diagnosis result = convert(FileKind::MaterialLibrary, link, sink);
    EXPECT_FALSE(result.opened);
    EXPECT_FALSE(result.complete());
    EXPECT_TRUE(result.reason().starts_with("the file changed while it was read")) << result.reason();
    EXPECT_EQ(xml, "");
}

TEST(UnluckyMoments, AFileBeyondTheArchiveLimitIsReadOnlyUpToItsFirstNul) {
    // Sparse: four gibibytes that cost no disk, of which only the text is read.
    const TempDir dir;
    const fs::path file = dir.file("huge.zelmat", std::string("<Assets/>\0never read", 20));
    fs::resize_file(file, (std::uint64_t{4} << 30) + 13);
    std::string xml;
    StringSink sink(xml);
    const Diagnosis result = convert(FileKind::MaterialLibrary, file, sink);
    const Diagnosis diagnosis = diagnose(FileKind::RenderOptions, file);
    EXPECT_TRUE(result.complete());
    EXPECT_FALSE(result.readsAsBinary);
    EXPECT_EQ(result.reason(), "header: the file is larger than the 4 GiB an archive can hold at offset 0");
    EXPECT_EQ(xml, "<Assets/>");
    EXPECT_EQ(diagnosis.fallbackLength, 9u);
}
