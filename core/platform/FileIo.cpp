#include "platform/FileIo.hpp"

#include <cerrno>
#include <cstring>
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

} // namespace

std::optional<SharedBytes> readRegularFile(const std::filesystem::path& path) {
    // O_NONBLOCK: opening a FIFO for reading must not wait for a writer.
    FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    if (file.get() < 0) return std::nullopt;
    struct stat info {};
    if (::fstat(file.get(), &info) != 0 || !S_ISREG(info.st_mode)) return std::nullopt;

    const auto size = static_cast<std::size_t>(info.st_size);
    char* data = nullptr;
    SharedBytes content = SharedBytes::allocate(size, data);
    std::size_t done = 0;
    while (done < size) {
        const ssize_t n = ::read(file.get(), data + done, size - done);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) return std::nullopt; // error, or the file shrank while we read it
        done += static_cast<std::size_t>(n);
    }
    return content;
}

AtomicFileWriter::AtomicFileWriter(std::filesystem::path target) : target_(std::move(target)) {
    std::filesystem::path temporary = target_;
    temporary += ".tmp-XXXXXX";
    temporary_ = temporary.string();
    fd_ = ::mkstemp(temporary_.data());
    if (fd_ < 0) {
        failWith("cannot create a temporary file beside " + target_.string());
        temporary_.clear();
    }
}

AtomicFileWriter::~AtomicFileWriter() {
    if (fd_ >= 0) ::close(fd_);
    if (!committed_ && !temporary_.empty()) ::unlink(temporary_.c_str());
}

bool AtomicFileWriter::failWith(std::string what) {
    if (error_.empty()) error_ = std::move(what) + ": " + std::strerror(errno);
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
    if (::ftruncate(fd_, 0) != 0 || ::lseek(fd_, 0, SEEK_SET) != 0)
        return failWith("cannot empty " + temporary_);
    return true;
}

bool AtomicFileWriter::flush() {
    std::string_view rest = buffer_;
    while (!rest.empty()) {
        const ssize_t n = ::write(fd_, rest.data(), rest.size());
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) {
            if (n == 0) errno = EIO;
            return failWith("cannot write " + temporary_);
        }
        rest.remove_prefix(static_cast<std::size_t>(n));
    }
    buffer_.clear();
    return true;
}

bool AtomicFileWriter::commit(std::string* error) {
    if (error_.empty() && flush()) {
        const int fd = std::exchange(fd_, -1);
        const bool synced = ::fsync(fd) == 0;
        if (!synced) failWith("cannot finish writing " + temporary_);
        if (::close(fd) != 0 && synced) failWith("cannot finish writing " + temporary_);
        if (error_.empty()) {
            // mkstemp creates the file readable by its owner only; give it the usual mode.
            const mode_t mask = ::umask(0);
            ::umask(mask);
            ::chmod(temporary_.c_str(), 0666 & ~mask);
            if (::rename(temporary_.c_str(), target_.c_str()) == 0)
                committed_ = true;
            else
                failWith("cannot replace " + target_.string());
        }
    }
    if (!committed_ && error) *error = error_;
    return committed_;
}

bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error) {
    AtomicFileWriter file(path);
    file.append(content);
    return file.commit(error);
}

} // namespace OrvexKavorCore
