#pragma once
// The progress line of a batch conversion: files done, the rate of XML written and
// the time left, redrawn in place on standard error. Shown only when standard
// error is a terminal; elsewhere (a log file, a pipe) nothing is written.
#include <chrono>
#include <cstddef>
#include <cstdint>

namespace dexmor {

class ProgressLine {
public:
    // `wanted`: false hides the line even on a terminal.
    ProgressLine(std::size_t totalFiles, bool wanted);

    bool shown() const { return shown_; }
    // Redraws the line with the current counts.
    void update(std::size_t filesDone, std::uint64_t bytesWritten);
    // Draws the final counts and ends the line.
    void finish(std::size_t filesDone, std::uint64_t bytesWritten);

private:
    std::size_t total_;
    bool shown_;
    std::chrono::steady_clock::time_point start_;
};

} // namespace dexmor
