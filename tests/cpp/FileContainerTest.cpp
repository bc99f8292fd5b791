// The framing of material library and render-options files, the pass-through of
// files that are not binary, and saving without losing the previous file.
#include "TrimSupport.hpp"

#include <dexmor/dexmor.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>

#include <filesystem>
#include <sys/stat.h>

using namespace OrvexKavorCore;
using namespace testsupport;
namespace fs = std::filesystem;

namespace {

std::string header(std::uint16_t generation, std::uint32_t count, std::uint16_t first = 0) {
    return textOf(Image{}.version(first, generation).u32(count).bytes);
}

// A material whose record always fails to write.
class UnwritableMaterial : public BaseMaterial {
public:
    bool writeToArchive(QuickArchive&) override { return false; }
    bool readFromArchive(QuickArchive&) override { return false; }
    std::int32_t kindId() const override { return kLayeredBRDF; }
    void resetToDefaults() override {}
    MaterialPtr cloneRenamed() const override { return {}; }
    MaterialPtr clone() const override { return {}; }
    bool isEqual(const MaterialPtr&) const override { return false; }
};

} // namespace

TEST(MaterialFile, FramingOfTheThreeGenerations) {
    const std::string run = "\x01\x0D\x0A\x02\x0D";
    auto gen1 = ZelMatFile::readFraming(header(1, 1) + run);
    auto gen2 = ZelMatFile::readFraming(header(2, 1) + run);
    ASSERT_TRUE(gen1 && gen2);
    EXPECT_TRUE(gen1->generation == 1 && gen1->count == 1u);
    // Generation 1 loses every 0x0D byte, wherever it stands; generation 2 keeps them.
    EXPECT_EQ(textOf(bytesOf(gen1->archive)), "\x01\x0A\x02");
    EXPECT_EQ(textOf(bytesOf(gen2->archive)), run);

    QuickArchive image(1);
    image.write(std::int32_t{42});
    std::ostringstream out;
    image.save(out);
    auto gen3 = ZelMatFile::readFraming(header(3, 1) + out.str());
    ASSERT_TRUE(gen3);
    EXPECT_EQ(gen3->archive.get<std::int32_t>(), 42);
}

TEST(MaterialFile, UnusableHeadersAreRejectedWithAReason) {
    ReadFailure why;
    EXPECT_FALSE(ZelMatFile::readFraming(header(3, 0), &why));
    EXPECT_NE(why.reason.find("no materials"), std::string::npos);
    for (const std::string& bad : {header(3, 1, 1), header(4, 1), header(0, 1), std::string("\x00\x00\x03")})
        EXPECT_FALSE(ZelMatFile::readFraming(bad, &why)); // the first half not 0, unknown generations, cut short
    EXPECT_FALSE(ZelMatFile::readFraming(header(3, 1) + std::string("\x01\x00\x00\x00", 4) + "short", &why));
    EXPECT_EQ(why.recordPathText(), "archive image");
}

TEST(MaterialFile, AFailedReadKeepsTheListAndSaysWhy) {
    ZelMatFile file;
    file.add(MaterialPtr(new UnwritableMaterial));
    const std::string body("\x0F\0\0\0", 4); // material kind 15
    EXPECT_FALSE(file.readFromBytes(header(2, 1) + body + std::string(8, '\0')));
    EXPECT_EQ(file.count(), 1u);
    ASSERT_TRUE(file.lastReadFailure());
    // Offsets are file offsets: after the header, and in a generation-1 file
    // counting the carriage returns its reader drops.
    EXPECT_EQ(file.lastReadFailure()->describe(), "material 0: unknown material kind 15 at offset 12");
    EXPECT_FALSE(file.readFromBytes(header(1, 1) + "\r\r" + body.substr(0, 2) + "\r" + body.substr(2) +
                                    std::string(8, '\0')));
    EXPECT_EQ(file.lastReadFailure()->offset, 8u + 2 + 4 + 1);
}

TEST(MaterialFile, LookUpByIndexAndName) {
    ZelMatFile file;
    for (const char* name : {"Oak", "\xC3\x89tain", "oak"}) {
        MaterialPtr m(new UnwritableMaterial);
        m->name = name;
        file.add(m);
    }
    MaterialPtr found;
    EXPECT_EQ(file.indexOf("OAK"), 0);
    EXPECT_EQ(file.indexOf("\xC3\xA9tain"), -1); // non-ASCII case is not folded
    EXPECT_TRUE(file.get("\xC3\x89TAIN", found) && found == file.materials[1]);
    EXPECT_FALSE(file.get(3, found));
}

TEST(MaterialFile, AFailedSaveKeepsThePreviousFileAndComposesAMessage) {
    TempDir dir;
    const fs::path target = dir.file("library.zelmat", "previous content");
    ZelMatFile file;
    EXPECT_FALSE(file.save(target)); // an empty list cannot be written
    MaterialPtr m(new UnwritableMaterial);
    m->name = "Oak";
    file.add(m);
    EXPECT_FALSE(file.save(target));
    EXPECT_EQ(file.lastError(), "An error has occurred while attempting to serialize \"Oak\" - aborting zelmat creation");
    std::ifstream in(target, std::ios::binary);
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(in), {}), "previous content");
    EXPECT_EQ(std::distance(fs::directory_iterator(dir.path()), fs::directory_iterator()), 1);
}

TEST(MaterialFile, OpenModeProbe) {
    TempDir dir;
    EXPECT_EQ(ZelMatFile::probeOpenMode(dir.path() / "missing.zelmat"), std::ios_base::in);
    EXPECT_EQ(ZelMatFile::probeOpenMode(dir.file("a.zelmat", header(1, 1))), std::ios_base::in);
    EXPECT_EQ(ZelMatFile::probeOpenMode(dir.file("b.zelmat", header(3, 1))), std::ios_base::in | std::ios_base::binary);
}

// (The extension test and the encodings of passed-through text: tests/python/test_module.py.)
TEST(Conversion, FilesThatAreNotBinaryPassThroughAsText) {
    TempDir dir;
    for (FileKind kind : {FileKind::MaterialLibrary, FileKind::RenderOptions}) {
        const std::string ext = "." + std::string(extensionOf(kind));
        EXPECT_EQ(convertToXml(kind, dir.file("n" + ext, std::string("ab\0cd", 5))), "ab");
        const std::string large(3'000'017, 'x'); // read into a buffer of huge pages
        EXPECT_EQ(convertToXml(kind, dir.file("l" + ext, large)), large);
        EXPECT_EQ(convertToXml(kind, dir.path() / ("missing" + ext)), "");
        EXPECT_EQ(convertToXml(kind, dir.path()), ""); // a directory cannot be opened
        const fs::path fifo = dir.path() / ("fifo" + ext);
        ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
        EXPECT_EQ(convertToXml(kind, fifo), ""); // and must not block
    }
    // A binary library that does not read gives its bytes up to the first NUL.
    EXPECT_EQ(convertToXml(FileKind::MaterialLibrary, dir.file("bin.zelmat", header(3, 0))), "");
}

namespace {

// An object whose record is `size` bytes of a counter, read back and checked.
class CountingRecord : public OrvexSerializable {
public:
    explicit CountingRecord(std::uint32_t size) : size_(size) {}
    bool writeToArchive(QuickArchive& ar) override {
        ar.write(size_);
        for (std::uint32_t i = 0; i < size_; ++i) ar.putByte(static_cast<std::uint8_t>(i));
        return true;
    }
    bool readFromArchive(QuickArchive& ar) override {
        if (ar.get<std::uint32_t>() != size_) return ar.fail("wrong size");
        for (std::uint32_t i = 0; i < size_; ++i)
            if (ar.get<std::uint8_t>() != static_cast<std::uint8_t>(i)) return ar.fail("wrong byte");
        return true;
    }

private:
    std::uint32_t size_;
};

} // namespace

TEST(OptionsFile, TheFileIsTheArchiveChunks) {
    TempDir dir;
    ZelOptFile file;
    CountingRecord small(10), large(5000);
    const fs::path a = dir.path() / "small.zelopt", b = dir.path() / "large.zelopt";
    ASSERT_TRUE(file.writeFile(small, a));
    ASSERT_TRUE(file.writeFile(large, b));
    EXPECT_TRUE(fs::file_size(a) == 4096u && fs::file_size(b) == 8192u);
    EXPECT_TRUE(file.readFile(small, a) && file.readFile(large, b));

    // Trailing chunks behind the record are ignored.
    std::ofstream(a, std::ios::app | std::ios::binary) << std::string(4096, 'x');
    EXPECT_TRUE(file.readFile(small, a));

    EXPECT_FALSE(file.readFile(large, a));
    ASSERT_TRUE(file.lastReadFailure());
    EXPECT_EQ(file.lastReadFailure()->reason, "wrong size");
    EXPECT_FALSE(file.readFile(small, dir.file("empty.zelopt", "")));
    EXPECT_FALSE(file.readFile(small, dir.path() / "missing.zelopt"));
}

TEST(MaterialFile, OneMaterialsBlock) {
    // A material that claims the layered kind without being one gives an empty block.
    EXPECT_EQ(ZelMatFile::toXml(MaterialPtr(new UnwritableMaterial)), "<Assets>\n</Assets>\n");
}
