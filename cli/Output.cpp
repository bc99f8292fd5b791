#include "Output.hpp"

#include <cerrno>
#include <cstring>
#include <string>

#include <unistd.h>

namespace dexmor {

bool writeAll(int fd, std::string_view data) {
    while (!data.empty()) {
        const ssize_t n = ::write(fd, data.data(), data.size());
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) {
            if (n == 0) errno = EIO;
            return false;
        }
        data.remove_prefix(static_cast<std::size_t>(n));
    }
    return true;
}

void complain(std::initializer_list<std::string_view> pieces) {
    std::string line = "dexmor: ";
    for (std::string_view piece : pieces) line += piece;
    line += '\n';
    writeAll(STDERR_FILENO, line);
}

int usageError(std::initializer_list<std::string_view> pieces) {
    complain(pieces);
    writeAll(STDERR_FILENO, "Try 'dexmor --help' for more information.\n");
    return Rejected;
}

bool StandardOutput::write(std::string_view data) {
    used_ = true;
    if (writeAll(STDOUT_FILENO, data)) return true;
    complain({"cannot write to standard output: ", std::strerror(errno)});
    return false;
}

bool StandardOutput::finish() {
    if (!used_ || ::close(STDOUT_FILENO) == 0 || errno == EINTR) return true;
    complain({"cannot write to standard output: ", std::strerror(errno)});
    return false;
}

int showText(std::string_view text) {
    StandardOutput out;
    const bool written = out.write(text);
    return out.finish() && written ? Success : Failed;
}

} // namespace dexmor
