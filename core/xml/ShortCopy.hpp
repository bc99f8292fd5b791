#pragma once
// Copies of a few bytes without a call into the C library: most of what the
// asset writer copies is a tag, a name or a number of under 32 bytes, where the
// call costs more than the copy.
#include <cstddef>
#include <cstring>

namespace OrvexKavorCore {

// Copies `size` bytes with two overlapping loads and stores of a width that fits.
inline void copyShort(char* to, const char* from, std::size_t size) {
    const auto pair = [&]<std::size_t kWidth>() {
        char head[kWidth], tail[kWidth];
        std::memcpy(head, from, kWidth);
        std::memcpy(tail, from + size - kWidth, kWidth);
        std::memcpy(to, head, kWidth);
        std::memcpy(to + size - kWidth, tail, kWidth);
    };
    if (size > 32)
        std::memcpy(to, from, size);
    else if (size >= 16)
        pair.template operator()<16>();
    else if (size >= 8)
        pair.template operator()<8>();
    else if (size >= 4)
        pair.template operator()<4>();
    else if (size > 0) {
        to[0] = from[0];
        to[size / 2] = from[size / 2];
        to[size - 1] = from[size - 1];
    }
}

} // namespace OrvexKavorCore
