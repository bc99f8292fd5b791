// The conversion as the module and the tool call it: a library streamed one
// material at a time gives the same document as reading it whole, and the
// diagnosis says what a file holds or why it did not read.
#include "MaterialTestSupport.hpp"

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/dexmor.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/textures/SkyTexture.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>

#include <unistd.h>

using namespace materialtest;
using namespace testsupport;

namespace {

// A layered material whose diffuse layer's colour is a sky; the sky's record
// stores the default sun as it is when the file is written.
MaterialPtr materialWithSky(const std::string& name) {
    auto diffuse = boost::make_shared<Diffuse_BRDF>();
    diffuse->colorTex = boost::make_shared<SkyTexture>();
    auto material = make<MaterialLayeredBRDF>(name);
    material->layers.push_back(diffuse);
    return material;
}

std::string libraryBytes(std::vector<MaterialPtr> materials) {
    ZelMatFile file;
    file.materials = std::move(materials);
    std::ostringstream out;
    EXPECT_TRUE(file.writeToStream(out)) << file.lastError();
    return out.str();
}

// The document as the library read whole gives it.
std::string wholeDocument(const std::string& bytes) {
    const ConversionContext fresh1;
    ZelMatFile file;
    EXPECT_TRUE(file.readFromBytes(bytes));
    std::string xml;
    AssetXmlWriter writer(xml);
    for (const MaterialPtr& material : file.materials) writeMaterialAssets(writer, material);
    return xml;
}

// A destination that can take back what it was sent, counting how often it did.
struct TakingBack final : DocumentSink {
    std::string text;
    int drops = 0;
    void write(std::string_view piece) override { text.append(piece); }
    bool canTakeBack() const override { return true; }
    void takeBack() override {
        text.clear();
        ++drops;
    }
};

// The text a destination that takes back what it was sent ends up with.
std::string readOnceIntoFile(const std::string& bytes, int* takenBack = nullptr) {
    TakingBack file;
    convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), file);
    if (takenBack) *takenBack = file.drops;
    return file.text;
}

using Conversions = LibraryTest;

TEST_F(Conversions, ReadOnceOrTwiceTheDocumentIsTheSame) {
    // Both skies store the default sun with turbidity 7.5; the last stored one is
    // changed to 9.25. Both skies show the default sun as the last sky record
    // left it, although the first is written before the second is read again.
    sharedDefaultSun()->turbidity = 7.5f;
    std::string bytes = libraryBytes({materialWithSky("first"), make<MaterialLayeredBRDF>("plain"),
                                      materialWithSky("second")});
    const std::string turbidity("\x00\x00\xF0\x40", 4), changed("\x00\x00\x14\x41", 4); // 7.5f, 9.25f
    bytes.replace(bytes.rfind(turbidity), 4, changed);
    const std::string expected = wholeDocument(bytes);
    EXPECT_NE(expected.find("<value>9.25</value>"), std::string::npos);
    EXPECT_EQ(expected.find("<value>7.5</value>"), std::string::npos);

    EXPECT_EQ(streamedXml(FileKind::MaterialLibrary, bytes), expected);
    // Converted whole, or into a destination that can drop what it was sent, each
    // material is read once: the skies' differing default suns send it back to
    // the two readings.
    EXPECT_EQ(convertBytesToXml(FileKind::MaterialLibrary, bytes), expected);
    int takenBack = 0;
    EXPECT_EQ(readOnceIntoFile(bytes, &takenBack), expected);
    EXPECT_EQ(takenBack, 1);
    const std::string sameSuns = libraryBytes({materialWithSky("first"), materialWithSky("second")});
    EXPECT_EQ(convertBytesToXml(FileKind::MaterialLibrary, sameSuns), wholeDocument(sameSuns));
    EXPECT_EQ(readOnceIntoFile(sameSuns, &takenBack), wholeDocument(sameSuns));
    EXPECT_EQ(takenBack, 0);
    EXPECT_EQ(convertBytesToXml(FileKind::MaterialLibrary, sample("sample.zelmat")),
              wholeDocument(sample("sample.zelmat")));
}

TEST_F(Conversions, ALibraryFailingAtItsLastMaterialSendsNoMaterial) {
    std::string bytes = libraryBytes({make<MaterialLayeredBRDF>("a"), make<MaterialLayeredBRDF>("b")});
    const std::size_t secondAt = storedForm(make<MaterialLayeredBRDF>("a")).size();
    bytes[12 + secondAt] = 99; // the second material's kind id, in the first chunk

    EXPECT_EQ(streamedPieces(FileKind::MaterialLibrary, bytes),
              std::vector<std::string>{""}); // the pass-through text: the header starts with a NUL
    // Converted whole, or into a destination that can drop what it was sent, the
    // library's text is taken back before the pass-through text.
    std::string document = "kept";
    StringSink whole(document);
    const Diagnosis result = convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), whole);
    EXPECT_EQ(document, "kept");
    int takenBack = 0;
    EXPECT_EQ(readOnceIntoFile(bytes, &takenBack), "");
    EXPECT_EQ(takenBack, 1);
    EXPECT_FALSE(result.readsAsBinary);
    ASSERT_TRUE(result.failure);
    EXPECT_EQ(result.failure->describe(),
              "material 1: unknown material kind 99 at offset " + std::to_string(12 + secondAt + 4));
}

TEST_F(Conversions, ADefaultSunChangedOnlyFromZeroToMinusZeroGivesOneDocument) {
    // Every stored copy of the default sun's shadow bias is 0, the last one -0:
    // the skies must show "-0" however the library is read.
    const float marker = 1234.5f;
    sharedDefaultSun()->shadowBias = marker;
    std::string bytes = libraryBytes({materialWithSky("first"), materialWithSky("second")});
    const std::string stored(reinterpret_cast<const char*>(&marker), 4);
    const std::size_t last = bytes.rfind(stored);
    for (std::size_t at = bytes.find(stored); at != std::string::npos; at = bytes.find(stored, at + 4))
        bytes.replace(at, 4, at == last ? std::string("\x00\x00\x00\x80", 4) : std::string(4, '\0'));
    const std::string once = convertBytesToXml(FileKind::MaterialLibrary, bytes);
    EXPECT_EQ(once, streamedXml(FileKind::MaterialLibrary, bytes));
    EXPECT_NE(once.find("<value>-0</value>"), std::string::npos);
}

TEST_F(Conversions, TextReachesTheSinkInPiecesOfBoundedSizeEvenWithinOneMaterial) {
    // One material of 3,000 layers: its text alone is far above a piece.
    auto material = make<MaterialLayeredBRDF>("many");
    for (int i = 0; i < 3000; ++i) material->layers.push_back(boost::make_shared<Diffuse_BRDF>());
    const std::string bytes = libraryBytes({material});
    const std::vector<std::string> pieces = streamedPieces(FileKind::MaterialLibrary, bytes);
    std::string joined;
    for (const std::string& piece : pieces) {
        EXPECT_LE(piece.size(), std::size_t{72} * 1024);
        joined += piece;
    }
    EXPECT_GT(pieces.size(), 10u);
    EXPECT_EQ(joined, convertBytesToXml(FileKind::MaterialLibrary, bytes));
}

TEST_F(Conversions, AnAtomicFileAppearsWholeOnlyOnCommit) {
    const std::filesystem::path dir = std::filesystem::temp_directory_path() / ("dexmor-sink-" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    const std::filesystem::path target = dir / "out.xml";
    const std::string bytes = libraryBytes({make<MaterialLayeredBRDF>("a"), make<MaterialLayeredBRDF>("b")});
    {
        AtomicFileSink sink(target);
        EXPECT_TRUE(convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink).readsAsBinary);
        EXPECT_FALSE(std::filesystem::exists(target)); // nothing in place before the commit
    }
    EXPECT_TRUE(std::filesystem::is_empty(dir)); // and no temporary left behind
    {
        AtomicFileSink sink(target);
        convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink);
        std::string error;
        ASSERT_TRUE(sink.commit(&error)) << error;
        EXPECT_EQ(sink.bytesWritten(), convertBytesToXml(FileKind::MaterialLibrary, bytes).size());
    }
    std::ifstream in(target, std::ios::binary);
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(in), {}), convertBytesToXml(FileKind::MaterialLibrary, bytes));
    std::filesystem::remove_all(dir);
}

TEST_F(Conversions, DiagnosisSaysWhatAFileHoldsOrWhyItDidNotRead) {
    const Diagnosis library = diagnoseBytes(FileKind::MaterialLibrary, sample("sample.zelmat"));
    EXPECT_TRUE(library.readsAsBinary);
    EXPECT_EQ(library.description, "material library, generation 3, 20 materials");
    const Diagnosis options = diagnoseBytes(FileKind::RenderOptions, sample("sample.zelopt"));
    EXPECT_TRUE(options.readsAsBinary);
    EXPECT_EQ(options.description, "render options, version 23");

    // An options file is not a library: its first word is not a library version.
    const Diagnosis swapped = diagnoseBytes(FileKind::MaterialLibrary, sample("sample.zelopt"));
    EXPECT_FALSE(swapped.readsAsBinary);
    ASSERT_TRUE(swapped.failure);
    EXPECT_EQ(swapped.failure->describe(), "header: unknown file version (1, 23) at offset 0");
    EXPECT_EQ(swapped.fallbackLength, 1u); // "\x01", the bytes before the first NUL

    const Diagnosis text = diagnoseBytes(FileKind::RenderOptions, "<Assets>caf\xE9</Assets>");
    EXPECT_EQ(std::tuple(text.opened, text.readsAsBinary), std::tuple(true, false));
    EXPECT_EQ(text.fallbackLength, std::string("<Assets>caf\xC3\xA9</Assets>").size());

    const Diagnosis missing = diagnose(FileKind::MaterialLibrary, "/nonexistent/x.zelmat");
    EXPECT_FALSE(missing.opened);
    EXPECT_EQ(missing.fallbackLength, 0u);
    ASSERT_TRUE(missing.failure);
    EXPECT_EQ(missing.reason(), "the file cannot be opened: No such file or directory");
    EXPECT_EQ(missing.openError, ENOENT);
}

} // namespace
