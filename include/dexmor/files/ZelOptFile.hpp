#pragma once
// ZelOptFile: a render-options file (".zelopt").
//
// The file is the archive's chunks and nothing else: chunk k (4096 bytes) at
// offset 4096k, no header and no chunk count. The options set's own record begins
// with its version word; the bytes behind the end of the record are padding.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Serializable.hpp>

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

class ZelOptFile {
public:
    virtual ~ZelOptFile() = default;

    // Stores the object's record: serialised completely first, then written to a
    // temporary file and renamed over `path`.
    virtual bool writeFile(OrvexSerializable& object, const std::filesystem::path& path);
    // Loads the object from the file; false for a missing, empty or unreadable file
    // or a record the object rejects.
    virtual bool readFile(OrvexSerializable& object, const std::filesystem::path& path);
    // The same on the bytes of a file in memory; `observer`, when given, watches
    // the reading (see ReadObserver).
    bool readBytes(OrvexSerializable& object, std::string_view bytes, ReadObserver* observer = nullptr);

    const std::optional<ReadFailure>& lastReadFailure() const { return lastReadFailure_; }

private:
    std::optional<ReadFailure> lastReadFailure_;
};

} // namespace OrvexKavorCore
