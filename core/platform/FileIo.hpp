#pragma once
// Reading and writing whole files.
#include <dexmor/platform/SharedBytes.hpp>

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// The whole content of a regular file. A directory, FIFO, device or socket, a file
// that does not exist or cannot be opened, or a read that delivers fewer bytes
// than the file holds give nullopt. Never blocks on a FIFO.
std::optional<SharedBytes> readRegularFile(const std::filesystem::path& path);

// A file written piece by piece into a temporary file beside its target and renamed
// over the target by commit(), so that readers never see a part of it. Destroyed
// without a successful commit, it removes the temporary and leaves the target as
// it was.
class AtomicFileWriter {
public:
    explicit AtomicFileWriter(std::filesystem::path target);
    ~AtomicFileWriter();
    AtomicFileWriter(const AtomicFileWriter&) = delete;
    AtomicFileWriter& operator=(const AtomicFileWriter&) = delete;

    // Buffers and writes `data`; false once anything has failed (later calls do nothing).
    bool append(std::string_view data);
    // Drops everything appended so far: the file starts again empty. False once
    // anything has failed.
    bool discard();
    // Writes what is buffered, syncs, closes and renames. False, with `error` (when
    // given) saying why, on any failure along the way or an earlier one.
    bool commit(std::string* error = nullptr);

private:
    bool flush();
    bool failWith(std::string what);

    std::filesystem::path target_;
    std::string temporary_;
    int fd_ = -1;
    std::string buffer_;
    std::string error_;
    bool committed_ = false;
};

// Writes `content` to a temporary file beside `path`, checks every write and the
// close, then renames it over `path`. On failure the previous file is untouched
// and `error` (when given) says why.
bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error = nullptr);

} // namespace OrvexKavorCore
