#include "platform/HugePages.hpp"

#include <algorithm>
#include <cstdint>
#include <sys/mman.h>

namespace OrvexKavorCore {

void adviseHugePages(void* data, std::size_t size) {
    const auto begin = reinterpret_cast<std::uintptr_t>(data);
    const std::uintptr_t first = (begin + kHugePageSize - 1) / kHugePageSize * kHugePageSize;
    const std::uintptr_t last = (begin + size) / kHugePageSize * kHugePageSize;
    if (last > first) ::madvise(reinterpret_cast<void*>(first), last - first, MADV_HUGEPAGE);
}

void reserveForAppend(std::string& text, std::size_t more) {
    if (text.capacity() - text.size() >= more) return;
    const std::size_t capacity = std::max(2 * text.capacity(), text.size() + more);
    if (capacity < 2 * kHugePageSize) return text.reserve(capacity);
    // The advice has to come before the text is copied over.
    std::string grown;
    grown.reserve(capacity);
    adviseHugePages(grown.data(), grown.capacity());
    grown.append(text);
    text.swap(grown);
}

} // namespace OrvexKavorCore
