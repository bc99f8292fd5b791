#pragma once
// Reading and writing whole files.
#include <dexmor/platform/SharedBytes.hpp>

#include <cstdint>
#include <filesystem>
#include <limits>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// What reading a regular file gave.
struct FileContent {
    SharedBytes bytes;
    // The file is larger than the reader was asked to take whole: `bytes` holds
    // only its text up to the first NUL (or all of it when it has none).
    bool overLimit = false;
};

// Why a file could not be read: a message for a user ("cannot be opened:
// Permission denied") and the errno that says it to a program (ENOENT, EACCES,
// EISDIR; EINVAL for a file that is not a regular file, EIO for one that
// changed while it was read).
struct FileError {
    std::string message;
    int number = 0;
};

// The whole content of a regular file, read once into memory of its own. A file
// larger than `largestWhole` bytes is read only up to its first NUL (see
// FileContent). A directory, FIFO, device or socket, a file that cannot be
// opened or read, and one whose length changes while it is read (read again
// once first) give nullopt, with `error` (when given) saying why. Never blocks
// on a FIFO.
std::optional<FileContent> readRegularFile(const std::filesystem::path& path, FileError* error = nullptr,
                                           std::uint64_t largestWhole = std::numeric_limits<std::uint64_t>::max());

// A file written piece by piece and put in place over its target by commit(), so
// that readers never see a part of it. Where the file system allows, the file has
// no name until commit() links it, so that even a killed process leaves nothing
// behind; elsewhere it is a temporary file beside the target, which a process
// that called removeTemporariesOnSignals() removes on SIGINT, SIGTERM and SIGHUP.
// Destroyed without a successful commit, it leaves the target as it was.
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
    // Writes what is buffered, syncs, and puts the file in place. False, with
    // `error` (when given) saying why, on any failure along the way or an earlier one.
    bool commit(std::string* error = nullptr);

private:
    bool flush();
    bool failWith(std::string what);
    // Links the unnamed file under a fresh temporary name beside the target.
    bool nameUnnamedFile();

    std::filesystem::path target_;
    std::string temporary_; // the temporary's name, once it has one
    int fd_ = -1;
    bool unnamed_ = false;   // created with O_TMPFILE, not linked yet
    int registration_ = -1; // the temporary's slot among those removed on signals
    std::string buffer_;
    std::string error_;
    bool committed_ = false;
};

// Installs handlers for SIGINT, SIGTERM and SIGHUP that remove the temporary
// files of unfinished AtomicFileWriters, then end the process as the signal
// would have. For a program that owns its signals, such as a command-line tool.
void removeTemporariesOnSignals();

// Writes `content` to a temporary file beside `path`, checks every write and the
// close, then renames it over `path`. On failure the previous file is untouched
// and `error` (when given) says why.
bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error = nullptr);

} // namespace OrvexKavorCore
