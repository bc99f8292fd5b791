#include "platform/FileIo.hpp"

#include "platform/TemporaryRegistry.hpp"

#include <cerrno>
#include <cstring>
#include <random>
#include <utility>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace OrvexKavorCore {

namespace {

class FileDescriptor {
public:
    explicit FileDescriptor(int fd) : fd_(fd) {}
    ~FileDescriptor() {
        if (fd_ >= 0) ::close(fd_);
    }
    FileDescriptor(const FileDescriptor&) = delete;
    FileDescriptor& operator=(const FileDescriptor&) = delete;
    int get() const { return fd_; }

private:
    int fd_;
};

std::string systemError(std::string_view what) { return std::string(what) + ": " + std::strerror(errno); }

// Fails a read with errno's message and number.
std::nullopt_t failWith(FileError* error, std::string_view what) {
    if (error) *error = FileError{systemError(what), errno};
    return std::nullopt;
}

// Fails a read for a reason of its own, given the errno a system call would have set.
std::nullopt_t failWith(FileError* error, std::string what, int number) {
    if (error) *error = FileError{std::move(what), number};
    return std::nullopt;
}

// Reads up to `size` bytes at `offset`; the count read, or -1 on an error.
ssize_t readAt(int fd, char* data, std::size_t size, std::uint64_t offset) {
    std::size_t done = 0;
    while (done < size) {
        const ssize_t n = ::pread(fd, data + done, size - done, static_cast<off_t>(offset + done));
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return -1;
        if (n == 0) break;
        done += static_cast<std::size_t>(n);
    }
    return static_cast<ssize_t>(done);
}

// The file's text up to its first NUL, read in pieces.
std::optional<SharedBytes> readUpToFirstNul(int fd, FileError* error) {
    constexpr std::size_t kPiece = std::size_t{1} << 20;
    std::string text;
    for (std::uint64_t offset = 0;;) {
        const std::size_t before = text.size();
        text.resize(before + kPiece);
        const ssize_t n = readAt(fd, text.data() + before, kPiece, offset);
        if (n < 0) return failWith(error, "cannot be read");
        text.resize(before + static_cast<std::size_t>(n));
        if (const auto nul = text.find('\0', before); nul != std::string::npos) {
            text.resize(nul);
            break;
        }
        if (n == 0) break;
        offset += static_cast<std::uint64_t>(n);
    }
    return SharedBytes::adopt(std::move(text));
}

} // namespace

std::optional<FileContent> readRegularFile(const std::filesystem::path& path, FileError* error,
                                           std::uint64_t largestWhole) {
    // O_NONBLOCK: opening a FIFO for reading must not wait for a writer.
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    if (file.get() < 0) return failWith(error, "cannot be opened");
    // A file whose size changes while it is read is read once more: it was being
    // written, and may be whole now. A second change is an error.
    for (int attempt = 0;; ++attempt) {
        struct stat info {};
        if (::fstat(file.get(), &info) != 0) return failWith(error, "cannot be read");
        if (S_ISDIR(info.st_mode)) return failWith(error, "is a directory", EISDIR);
        if (!S_ISREG(info.st_mode)) return failWith(error, "is not a regular file", EINVAL);

        const auto size = static_cast<std::uint64_t>(info.st_size);
        if (size > largestWhole) {
            std::optional<SharedBytes> text = readUpToFirstNul(file.get(), error);
            if (!text) return std::nullopt;
            return FileContent{std::move(*text), true};
        }
        char* data = nullptr;
        SharedBytes content = SharedBytes::allocate(static_cast<std::size_t>(size), data);
        const ssize_t read = readAt(file.get(), data, static_cast<std::size_t>(size), 0);
        if (read < 0) return failWith(error, "cannot be read");
        char extra = 0;
        const ssize_t more = readAt(file.get(), &extra, 1, size);
        if (more < 0) return failWith(error, "cannot be read");
        if (static_cast<std::uint64_t>(read) == size && more == 0) return FileContent{std::move(content), false};
        if (attempt == 1)
            return failWith(error, "changed while it was read (its size said " + std::to_string(size) +
                                       " bytes, " + (more > 0 ? "more" : std::to_string(read)) + " could be read)",
                            EIO);
    }
}

// --- AtomicFileWriter ---

namespace {

std::filesystem::path folderOf(const std::filesystem::path& target) {
    const std::filesystem::path folder = target.parent_path();
    return folder.empty() ? std::filesystem::path(".") : folder;
}

// A temporary's name: short, so that any target name that fits the file system
// has room for one beside it.
std::filesystem::path temporaryPattern(const std::filesystem::path& target) {
    return folderOf(target) / ".dexmor-XXXXXX";
}

// Whether an unnamed file can be given a name: linkat() through /proc needs it mounted.
bool canNameUnnamedFiles() {
    static const bool available = ::access("/proc/self/fd", X_OK) == 0;
    return available;
}

} // namespace

AtomicFileWriter::AtomicFileWriter(std::filesystem::path target) : target_(std::move(target)) {
    if (canNameUnnamedFiles()) {
        fd_ = ::open(folderOf(target_).c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, 0666);
        unnamed_ = fd_ >= 0;
    }
    if (fd_ >= 0) return;
    // The file system has no unnamed files: a named temporary, removed on signals.
    temporary_ = temporaryPattern(target_).string();
    const temporaries::NamingWindow window;
    if (window.ok()) {
        registration_ = temporaries::enter(temporary_);
        fd_ = ::mkstemp(temporary_.data());
    }
    if (fd_ < 0) {
        failWith("cannot create a temporary file beside " + target_.string());
        temporaries::leave(std::exchange(registration_, -1));
        temporary_.clear();
    }
}

AtomicFileWriter::~AtomicFileWriter() {
    if (fd_ >= 0) ::close(fd_);
    if (!committed_ && !temporary_.empty()) ::unlink(temporary_.c_str());
    temporaries::leave(registration_);
}

bool AtomicFileWriter::failWith(std::string what) {
    if (error_.empty()) error_ = systemError(what);
    return false;
}

bool AtomicFileWriter::append(std::string_view data) {
    constexpr std::size_t kBufferSize = std::size_t{1} << 18;
    if (!error_.empty()) return false;
    if (buffer_.size() + data.size() < kBufferSize) {
        buffer_.append(data);
        return true;
    }
    if (!flush()) return false;
    if (data.size() < kBufferSize) {
        buffer_.append(data);
        return true;
    }
    buffer_ = data; // a large piece goes straight out
    return flush();
}

bool AtomicFileWriter::discard() {
    if (!error_.empty()) return false;
    buffer_.clear();
    if (::ftruncate(fd_, 0) != 0 || ::lseek(fd_, 0, SEEK_SET) != 0) return failWith("cannot empty the temporary file");
    return true;
}

bool AtomicFileWriter::flush() {
    std::string_view rest = buffer_;
    while (!rest.empty()) {
        const ssize_t n = ::write(fd_, rest.data(), rest.size());
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) {
            if (n == 0) errno = EIO;
            return failWith("cannot write " + target_.string());
        }
        rest.remove_prefix(static_cast<std::size_t>(n));
    }
    buffer_.clear();
    return true;
}

bool AtomicFileWriter::nameUnnamedFile() {
    // linkat() does not replace a file: the unnamed file gets a fresh name of its
    // own, which rename() then puts over the target in one step.
    const std::string proc = "/proc/self/fd/" + std::to_string(fd_);
    std::random_device entropy;
    std::mt19937_64 random((std::uint64_t{entropy()} << 32) ^ entropy() ^ static_cast<std::uint64_t>(::getpid()));
    static constexpr char kLetters[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789";
    const std::string pattern = temporaryPattern(target_).string();
    for (int attempt = 0; attempt < 100; ++attempt) {
        std::string name = pattern;
        for (std::size_t i = name.size() - 6; i < name.size(); ++i) name[i] = kLetters[random() % (sizeof kLetters - 1)];
        const int slot = temporaries::enter(name);
        if (::linkat(AT_FDCWD, proc.c_str(), AT_FDCWD, name.c_str(), AT_SYMLINK_FOLLOW) == 0) {
            temporary_ = std::move(name);
            registration_ = slot;
            unnamed_ = false;
            return true;
        }
        temporaries::leave(slot);
        if (errno != EEXIST) break;
    }
    return failWith("cannot name the new file beside " + target_.string());
}

bool AtomicFileWriter::commit(std::string* error) {
    if (error_.empty() && flush()) {
        const bool synced = ::fsync(fd_) == 0;
        if (!synced) failWith("cannot finish writing " + target_.string());
        const temporaries::NamingWindow window;
        if (!window.ok()) {
            errno = EINTR;
            failWith("cannot put " + target_.string() + " in place");
        }
        if (error_.empty() && unnamed_) nameUnnamedFile();
        const int fd = std::exchange(fd_, -1);
        if (::close(fd) != 0 && error_.empty()) failWith("cannot finish writing " + target_.string());
        if (error_.empty()) {
            if (registration_ >= 0 || !temporary_.empty()) {
                // mkstemp creates the file readable by its owner only; give it the
                // usual mode (an unnamed file was created with it).
                const mode_t mask = ::umask(0);
                ::umask(mask);
                ::chmod(temporary_.c_str(), 0666 & ~mask);
            }
            if (::rename(temporary_.c_str(), target_.c_str()) == 0) {
                committed_ = true;
                temporaries::leave(std::exchange(registration_, -1));
            } else {
                failWith("cannot replace " + target_.string());
            }
        }
    }
    if (!committed_ && error) *error = error_;
    return committed_;
}

void removeTemporariesOnSignals() { temporaries::removeOnSignals(); }

bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error) {
    AtomicFileWriter file(path);
    file.append(content);
    return file.commit(error);
}

} // namespace OrvexKavorCore
