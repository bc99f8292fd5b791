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
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/materials/BaseMaterial.hpp>

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

    // The "<Assets>" block of one material, written in a conversion context of its own.
    static std::string toXml(const MaterialPtr& material);

    // Splits header and archive; nullopt (with `failure` set) when the header is unusable.
    static std::optional<Framing> readFraming(std::string_view bytes, ReadFailure* failure = nullptr);
    // The same without copying: the archive reads `bytes` in place (generation 1 excepted).
    static std::optional<Framing> readFraming(const SharedBytes& bytes, ReadFailure* failure = nullptr);

    // Reads the materials of a framed library one by one, handing each to `take`;
    // false, with `failure` set (at a file offset), at the first that does not read.
    static bool readMaterials(Framing& framing, const std::function<void(MaterialPtr&&)>& take,
                              ReadFailure& failure);

    // The message of the last failed write, and why the last read failed.
    const std::string& lastError() const { return lastError_; }
    const std::optional<ReadFailure>& lastReadFailure() const { return lastReadFailure_; }

private:
    // readRegularFile(), with lastReadFailure_ saying when it cannot be opened.
    std::optional<SharedBytes> readFile(const std::filesystem::path& path);
    // readFraming(), with lastReadFailure_ saying why it failed.
    std::optional<Framing> frame(const SharedBytes& bytes);

    std::string lastError_;
    std::optional<ReadFailure> lastReadFailure_;
};

} // namespace OrvexKavorCore
