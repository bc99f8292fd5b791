#pragma once
// Large buffers in huge pages. On the machines we run on, the first touch of a
// fresh 4 KiB page costs more than copying a page of data into it; a buffer of
// many megabytes is faulted in far faster in 2 MiB pages.
#include <cstddef>
#include <string>

namespace OrvexKavorCore {

inline constexpr std::size_t kHugePageSize = std::size_t{2} << 20;

// Asks the kernel to back the whole huge pages inside [data, data + size) with
// huge pages when they are first touched. Only advice: without it, or for a
// small buffer, nothing changes.
void adviseHugePages(void* data, std::size_t size);

// Makes room for `more` bytes after the text, growing the capacity at least
// twofold; a large new buffer gets the advice above before it is filled.
void reserveForAppend(std::string& text, std::size_t more);

} // namespace OrvexKavorCore
