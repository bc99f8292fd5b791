#include "platform/FileIo.hpp"

#include <cerrno>
#include <cstring>
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
    int release() {
        const int fd = fd_;
        fd_ = -1;
        return fd;
    }

private:
    int fd_;
};

} // namespace

std::optional<std::string> readRegularFile(const std::filesystem::path& path) {
    // O_NONBLOCK: opening a FIFO for reading must not wait for a writer.
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    if (file.get() < 0) return std::nullopt;
    struct stat info {};
    if (::fstat(file.get(), &info) != 0 || !S_ISREG(info.st_mode)) return std::nullopt;

    std::string content(static_cast<std::size_t>(info.st_size), '\0');
    std::size_t done = 0;
    while (done < content.size()) {
        const ssize_t n = ::read(file.get(), content.data() + done, content.size() - done);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) return std::nullopt; // error, or the file shrank while we read it
        done += static_cast<std::size_t>(n);
    }
    return content;
}

bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error) {
    const auto report = [&](std::string what) {
        if (error) *error = std::move(what) + ": " + std::strerror(errno);
        return false;
    };
    std::filesystem::path temporary = path;
    temporary += ".tmp-XXXXXX";
    std::string pattern = temporary.string();
    FileDescriptor file(::mkstemp(pattern.data()));
    if (file.get() < 0) return report("cannot create a temporary file beside " + path.string());

    std::size_t done = 0;
    while (done < content.size()) {
        const ssize_t n = ::write(file.get(), content.data() + done, content.size() - done);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) {
            const int saved = errno;
            ::unlink(pattern.c_str());
            errno = saved;
            return report("cannot write " + pattern);
        }
        done += static_cast<std::size_t>(n);
    }
    if (::fsync(file.get()) != 0 || ::close(file.release()) != 0) {
        const int saved = errno;
        ::unlink(pattern.c_str());
        errno = saved;
        return report("cannot finish writing " + pattern);
    }
    // mkstemp creates the file readable by its owner only; give it the usual mode.
    const mode_t mask = ::umask(0);
    ::umask(mask);
    ::chmod(pattern.c_str(), 0666 & ~mask);
    if (::rename(pattern.c_str(), path.c_str()) != 0) {
        const int saved = errno;
        ::unlink(pattern.c_str());
        errno = saved;
        return report("cannot replace " + path.string());
    }
    return true;
}

} // namespace OrvexKavorCore
