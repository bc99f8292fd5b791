#include "Progress.hpp"

#include "Output.hpp"

#include <cstdio>
#include <string>

#include <unistd.h>

namespace dexmor {

ProgressLine::ProgressLine(std::size_t totalFiles, bool wanted)
    : total_(totalFiles), shown_(wanted && ::isatty(STDERR_FILENO) == 1), start_(std::chrono::steady_clock::now()) {}

void ProgressLine::update(std::size_t filesDone, std::uint64_t bytesWritten) {
    if (!shown_) return;
    const double seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start_).count();
    const double megabytesPerSecond = seconds > 0 ? static_cast<double>(bytesWritten) / 1e6 / seconds : 0.0;
    char line[160];
    int length = 0;
    if (filesDone > 0 && filesDone < total_) {
        const auto left = static_cast<long long>(seconds / static_cast<double>(filesDone) *
                                                 static_cast<double>(total_ - filesDone));
        length = std::snprintf(line, sizeof line, "\rdexmor: %zu/%zu files, %.1f MB/s, %lld:%02lld left\x1b[K",
                               filesDone, total_, megabytesPerSecond, left / 60, left % 60);
    } else {
        length = std::snprintf(line, sizeof line, "\rdexmor: %zu/%zu files, %.1f MB/s\x1b[K", filesDone, total_,
                               megabytesPerSecond);
    }
    if (length > 0) writeAll(STDERR_FILENO, std::string_view(line, static_cast<std::size_t>(length)));
}

void ProgressLine::finish(std::size_t filesDone, std::uint64_t bytesWritten) {
    if (!shown_) return;
    update(filesDone, bytesWritten);
    writeAll(STDERR_FILENO, "\n");
}

} // namespace dexmor
