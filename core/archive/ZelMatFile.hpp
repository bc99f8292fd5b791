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
    };

    ZelMatFile() = default;
    virtual ~ZelMatFile() = default;

    std::vector<MaterialPtr> materials;

    // Writes the whole file; false (and nothing written) for an empty list, an empty
    // material pointer or a material whose record cannot be written.
    virtual bool writeToStream(std::ostream& out);
    // Reads a whole file; on failure the list keeps its earlier content.
    virtual bool readFromStream(std::istream& in);
    // The same on bytes in memory.
    bool readFromBytes(std::string_view bytes);

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
    // The "<Assets>" block of one material.
    static std::string toXml(const MaterialPtr& material);

    // Splits header and archive; nullopt (with `failure` set) when the header is unusable.
    static std::optional<Framing> readFraming(std::string_view bytes, ReadFailure* failure = nullptr);

    // The message of the last failed write, and why the last read failed.
    const std::string& lastError() const { return lastError_; }
    const std::optional<ReadFailure>& lastReadFailure() const { return lastReadFailure_; }

private:
    std::string lastError_;
    std::optional<ReadFailure> lastReadFailure_;
};

} // namespace OrvexKavorCore
