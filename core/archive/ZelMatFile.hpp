#pragma once
// ZelMatFile: a material library file (".zelmat").
//
// Layout as written, little-endian:
//   offset 0  VersionWord(0, 3)            bytes 00 00 03 00
//   offset 4  UInt32 material count M      at least 1
//   offset 8  the archive image: UInt32 chunk count C, then C chunks of 4096 bytes
// The archive holds, M times: Int32 material kind id, then the material's record.
//
// Three generations are read (the second half of the version word): 1 and 2 store
// the archive bytes as one plain run to the end of the file (generation 1 with
// every 0x0D byte removed before reading), 3 the chunked image above.
#include "archive/QuickArchive.hpp"
#include "materials/BaseMaterial.hpp"
#include "xml/TextSink.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <filesystem>
#include <functional>
#include <iosfwd>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

class ZelMatFile {
public:
    // The archive of a file, split from its 8-byte header.
    struct Framing {
        std::uint16_t generation = 0;
        std::uint32_t count = 0;
        QuickArchive archive;
        std::uint64_t archiveStart = 0; // file offset of the archive's first byte
        SharedBytes file;               // the whole file

        // The file offset of an archive position (generation 1 counts the
        // carriage returns its reader dropped).
        std::uint64_t fileOffsetOf(std::uint64_t archivePosition) const;
    };

    ZelMatFile() = default;
    virtual ~ZelMatFile() = default;

    std::vector<MaterialPtr> materials;

    // Writes the whole file; false (and nothing written) for an empty list, an empty
    // material pointer or a material whose record cannot be written.
    virtual bool writeToStream(std::ostream& out);
    // Reads a whole file; on failure the list keeps its earlier content.
    virtual bool readFromStream(std::istream& in);
    // The same on bytes in memory (the first copies them, the second reads them in place).
    bool readFromBytes(std::string_view bytes);
    bool readFromBytes(const SharedBytes& bytes);

    bool add(const MaterialPtr& material);
    std::size_t count() const { return materials.size(); }
    bool get(std::size_t index, MaterialPtr& out) const;
    // Index of the first material whose name equals `name` ignoring ASCII case, or -1.
    int indexOf(std::string_view name) const;
    bool get(std::string_view name, MaterialPtr& out) const;
    void names(std::vector<std::string>& out) const;

    bool load(const std::filesystem::path& path);
    // Serialises completely, then replaces the file atomically; a failed save
    // leaves the previous file as it was.
    bool save(const std::filesystem::path& path);

    // Text mode for a file of generation 1 or one that cannot be opened, binary otherwise.
    static std::ios_base::openmode probeOpenMode(const std::filesystem::path& path);

    // The XML text of the file at `path`, or its pass-through text (see Conversion.hpp).
    std::string toXml(const std::filesystem::path& path);
    // The same, streamed to `sink`.
    void toXml(const std::filesystem::path& path, const TextSink& sink);
    // The same for the bytes of a file.
    void bytesToXml(const SharedBytes& bytes, const TextSink& sink);
    // The same, appended to `document`. As nothing is sent before the whole text is
    // there, a failing library can take its text back: each material is read once.
    void bytesToXml(const SharedBytes& bytes, std::string& document);
    // The same, streamed to a destination that can drop what it was sent (a
    // temporary file): each material is read once. `takeBack` is called when the
    // text sent so far must go, because the bytes do not read as a library or a
    // later sky record changed the default sun; the whole text then follows.
    void bytesToXml(const SharedBytes& bytes, const TextSink& sink, const std::function<void()>& takeBack);

    // Streams the XML document of the library in `bytes` to `sink`, one material's
    // "<Assets>" block at a time, holding one material in memory. The library is
    // first read through once, each material dropped as soon as it has read, so
    // that a library failing anywhere sends nothing; then each material is read
    // again, written and dropped. False, with lastReadFailure() set and nothing
    // sent, when the bytes do not read as a library. `materials` is left alone.
    bool writeXml(const SharedBytes& bytes, const TextSink& sink);

    // Appends the XML document of the library in `bytes` to `document`, reading
    // each material once. False, with lastReadFailure() set and `document` as it
    // was, when the bytes do not read as a library.
    bool appendXml(const SharedBytes& bytes, std::string& document);

    // Whether the bytes read as a library, each material dropped as soon as it has
    // read; on success the header is returned (its archive read through), otherwise
    // lastReadFailure() says why. `materials` is left alone.
    std::optional<Framing> readThrough(const SharedBytes& bytes);
    // The "<Assets>" block of one material.
    static std::string toXml(const MaterialPtr& material);

    // Splits header and archive; nullopt (with `failure` set) when the header is unusable.
    static std::optional<Framing> readFraming(std::string_view bytes, ReadFailure* failure = nullptr);
    // The same without copying: the archive reads `bytes` in place (generation 1 excepted).
    static std::optional<Framing> readFraming(const SharedBytes& bytes, ReadFailure* failure = nullptr);

    // The message of the last failed write, and why the last read failed.
    const std::string& lastError() const { return lastError_; }
    const std::optional<ReadFailure>& lastReadFailure() const { return lastReadFailure_; }

private:
    // How a single reading of a library ended.
    enum class SingleReading {
        Written,     // the whole document was written
        NotALibrary, // the bytes do not read as a library (lastReadFailure_ says why)
        SunChanged,  // a sky record after the first material changed the default sun
    };
    // Writes the document to `text` reading each material once, calling
    // `blockWritten` (when given) after each material's block; unless Written,
    // what was written must be dropped.
    SingleReading writeXmlReadingOnce(const SharedBytes& bytes, std::string& text,
                                      const std::function<void()>& blockWritten);
    // readRegularFile(), with lastReadFailure_ saying when it cannot be opened.
    std::optional<SharedBytes> readFile(const std::filesystem::path& path);
    // readFraming(), with lastReadFailure_ saying why it failed.
    std::optional<Framing> frame(const SharedBytes& bytes);
    // Reads the materials of a framed library one by one, handing each to `take`;
    // false, with lastReadFailure_ set, at the first that does not read.
    bool readMaterials(Framing& framing, const std::function<void(MaterialPtr&&)>& take);

    std::string lastError_;
    std::optional<ReadFailure> lastReadFailure_;
};

} // namespace OrvexKavorCore
