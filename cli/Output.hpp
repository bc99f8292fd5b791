#pragma once
// What the tool's commands share: exit statuses, messages on standard error and
// checked writes to standard output.
#include <initializer_list>
#include <span>
#include <string>
#include <string_view>

namespace dexmor {

using Args = std::span<const std::string_view>;

// Exit statuses. When several things go wrong, the lower non-zero one wins.
constexpr int Success = 0;
constexpr int Failed = 1;   // an output could not be written, a conversion failed, a check found a file not binary
constexpr int Rejected = 2; // bad usage, or a FILE that cannot be converted
constexpr int Strict = 3;   // with --strict, a FILE that does not read as binary

// The status of two outcomes together: the lower non-zero one.
constexpr int worse(int a, int b) { return a == Success ? b : b == Success ? a : a < b ? a : b; }

// Writes all of `data` to a file descriptor. False, with errno set, on failure.
bool writeAll(int fd, std::string_view data);

// A file name as messages and reports show it: as it is, unless it holds a
// control character (a line feed would forge a line of output), then in double
// quotes with C escapes: "two\nlines".
std::string shownName(std::string_view name);

// One line on standard error: "dexmor: " and the pieces.
void complain(std::initializer_list<std::string_view> pieces);

// complain(), then a hint at --help; returns Rejected.
int usageError(std::initializer_list<std::string_view> pieces);

// Standard output, written unbuffered so that a failure shows at the write that
// meets it; finish() also checks the close. A failure is reported once: later
// writes do nothing and fail.
class StandardOutput {
public:
    bool write(std::string_view data);
    bool finish();

private:
    bool used_ = false;
    bool failed_ = false;
};

// Writes `text` to standard output: Success, or Failed when it cannot.
int showText(std::string_view text);

// The help text of the whole tool.
extern const std::string_view helpText;

} // namespace dexmor
