#include "Output.hpp"

#include <algorithm>
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

std::string shownName(std::string_view name) {
    const auto isControl = [](unsigned char c) { return c < 0x20 || c == 0x7F; };
    if (std::none_of(name.begin(), name.end(), isControl)) return std::string(name);
    std::string shown = "\"";
    for (const char c : name) {
        const auto byte = static_cast<unsigned char>(c);
        switch (c) {
        case '\n': shown += "\\n"; break;
        case '\t': shown += "\\t"; break;
        case '\r': shown += "\\r"; break;
        case '"': shown += "\\\""; break;
        case '\\': shown += "\\\\"; break;
        default:
            if (isControl(byte)) {
                static constexpr char kHex[] = "0123456789abcdef";
                shown += "\\x";
                shown += kHex[byte >> 4];
                shown += kHex[byte & 15];
            } else {
                shown += c;
            }
        }
    }
    return shown + '"';
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
    if (failed_) return false;
    if (writeAll(STDOUT_FILENO, data)) return true;
    complain({"cannot write to standard output: ", std::strerror(errno)});
    failed_ = true;
    return false;
}

bool StandardOutput::finish() {
    if (failed_) return false;
    if (!used_ || ::close(STDOUT_FILENO) == 0 || errno == EINTR) return true;
    complain({"cannot write to standard output: ", std::strerror(errno)});
    failed_ = true;
    return false;
}

int showText(std::string_view text) {
    StandardOutput out;
    const bool written = out.write(text);
    return out.finish() && written ? Success : Failed;
}

} // namespace dexmor
