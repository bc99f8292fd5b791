#include "OutputSink.hpp"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace dexmor {

namespace {

constexpr std::size_t kWriteSize = std::size_t{1} << 18;

bool isSameDevice(const struct stat& a, const char* path) {
    struct stat b{};
    return ::stat(path, &b) == 0 && S_ISCHR(b.st_mode) && a.st_rdev == b.st_rdev;
}

} // namespace

StandardOutputSink::StandardOutputSink() {
    struct stat status{};
    if (::fstat(STDOUT_FILENO, &status) != 0) return;
    isNull_ = S_ISCHR(status.st_mode) && isSameDevice(status, "/dev/null");
    // A regular file opened for appending may have other writers at its end: it
    // is not truncated.
    const int flags = ::fcntl(STDOUT_FILENO, F_GETFL);
    const bool truncatable = S_ISREG(status.st_mode) && flags >= 0 && (flags & O_APPEND) == 0 &&
                             ::lseek(STDOUT_FILENO, 0, SEEK_CUR) >= 0;
    canTakeBack_ = isNull_ || truncatable;
}

void StandardOutputSink::write(std::string_view piece) {
    if (gone_) return;
    pending_.append(piece);
    accepted_ += piece.size();
    if (pending_.size() >= kWriteSize) flush();
}

void StandardOutputSink::flush() {
    if (!gone_ && !pending_.empty()) gone_ = !out_.write(pending_);
    pending_.clear();
}

void StandardOutputSink::takeBack() {
    const std::uint64_t withdrawn = accepted_ - documentStart_;
    accepted_ = documentStart_;
    if (gone_ || withdrawn <= pending_.size()) {
        pending_.resize(pending_.size() - std::min<std::uint64_t>(withdrawn, pending_.size()));
        return;
    }
    const std::uint64_t written = withdrawn - pending_.size();
    pending_.clear();
    if (isNull_) return;
    const off_t end = ::lseek(STDOUT_FILENO, 0, SEEK_CUR);
    const off_t start = end - static_cast<off_t>(written);
    if (end < 0 || start < 0 || ::ftruncate(STDOUT_FILENO, start) != 0 || ::lseek(STDOUT_FILENO, start, SEEK_SET) != start) {
        complain({"cannot take back a document from standard output: ", std::strerror(errno)});
        gone_ = true;
    }
}

bool StandardOutputSink::finish() {
    flush();
    return out_.finish() && !gone_;
}

} // namespace dexmor
