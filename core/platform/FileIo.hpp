#pragma once
// Reading and writing whole files.
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// The whole content of a regular file. A directory, FIFO, device or socket, a file
// that does not exist or cannot be opened, or a read that delivers fewer bytes
// than the file holds give nullopt. Never blocks on a FIFO.
std::optional<std::string> readRegularFile(const std::filesystem::path& path);

// Writes `content` to a temporary file beside `path`, checks every write and the
// close, then renames it over `path`. On failure the previous file is untouched
// and `error` (when given) says why.
bool writeFileAtomically(const std::filesystem::path& path, std::string_view content, std::string* error = nullptr);

} // namespace OrvexKavorCore
