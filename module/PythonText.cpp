#include "PythonText.hpp"

#include "platform/HugePages.hpp"
#include "platform/Text.hpp"

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace dexmor::python {

namespace {

namespace core = OrvexKavorCore;

constexpr std::uint64_t kHighBits = 0x8080808080808080ull;

// A str's length counts code points, and its width (1, 2 or 4 bytes a
// character) follows its largest one. Both are read off the lead bytes: every
// byte but a continuation byte (10xxxxxx) starts a character, and the largest
// lead byte bounds the largest character (continuation bytes lie below any
// lead byte of a multi-byte sequence).
struct Shape {
    std::size_t characters = 0;
    std::uint8_t largestByte = 0;

    // What PyUnicode_New takes as the largest character.
    Py_UCS4 maxChar() const {
        if (largestByte < 0x80) return 0x7F;
        if (largestByte < 0xC4) return 0xFF; // C2 and C3 lead U+0080 to U+00FF
        if (largestByte < 0xF0) return 0xFFFF;
        return 0x10FFFF;
    }
};

Shape shapeOf(std::string_view utf8) {
    Shape shape;
    const char* p = utf8.data();
    std::size_t n = utf8.size();
    std::uint8_t largest = 0;
    const auto single = [&](char c) {
        const auto b = static_cast<std::uint8_t>(c);
        if ((b & 0xC0) != 0x80) ++shape.characters;
        largest = std::max(largest, b);
    };
    for (; n >= 8; p += 8, n -= 8) {
        std::uint64_t word;
        std::memcpy(&word, p, 8);
        if ((word & kHighBits) == 0)
            shape.characters += 8;
        else
            std::for_each(p, p + 8, single);
    }
    std::for_each(p, p + n, single);
    shape.largestByte = largest;
    return shape;
}

// Decodes valid UTF-8 into characters of type Unit.
template <class Unit>
void decodeInto(std::string_view utf8, Unit* out) {
    const auto* p = reinterpret_cast<const std::uint8_t*>(utf8.data());
    const std::uint8_t* end = p + utf8.size();
    while (p < end) {
        std::uint64_t word;
        if (end - p >= 8 && (std::memcpy(&word, p, 8), (word & kHighBits) == 0)) {
            std::copy(p, p + 8, out); // eight ASCII characters
            p += 8;
            out += 8;
            continue;
        }
        const std::uint32_t b = *p;
        if (b < 0x80) {
            *out++ = static_cast<Unit>(b);
            p += 1;
        } else if (b < 0xE0) {
            *out++ = static_cast<Unit>(((b & 0x1F) << 6) | (p[1] & 0x3F));
            p += 2;
        } else if (b < 0xF0) {
            *out++ = static_cast<Unit>(((b & 0x0F) << 12) | ((p[1] & 0x3F) << 6) | (p[2] & 0x3F));
            p += 3;
        } else {
            *out++ = static_cast<Unit>(((b & 0x07) << 18) | ((p[1] & 0x3F) << 12) | ((p[2] & 0x3F) << 6) |
                                       (p[3] & 0x3F));
            p += 4;
        }
    }
}

} // namespace

PyObject* strFromUtf8(std::string_view utf8) {
    const Shape shape = shapeOf(utf8);
    // A short text is left to the interpreter, as is text that does not decode:
    // its error says where.
    if (utf8.size() < core::kHugePageSize || (shape.largestByte >= 0x80 && !core::text::isValidUtf8(utf8)))
        return PyUnicode_DecodeUTF8(utf8.data(), static_cast<Py_ssize_t>(utf8.size()), "strict");

    PyObject* result = PyUnicode_New(static_cast<Py_ssize_t>(shape.characters), shape.maxChar());
    if (!result) return nullptr;
    void* characters = PyUnicode_DATA(result);
    // The str of a large document is made in memory that faults in huge pages.
    core::adviseHugePages(characters, shape.characters * static_cast<std::size_t>(PyUnicode_KIND(result)));
    switch (PyUnicode_KIND(result)) {
    case PyUnicode_1BYTE_KIND:
        if (shape.largestByte < 0x80)
            std::memcpy(characters, utf8.data(), utf8.size());
        else
            decodeInto(utf8, static_cast<Py_UCS1*>(characters));
        break;
    case PyUnicode_2BYTE_KIND: decodeInto(utf8, static_cast<Py_UCS2*>(characters)); break;
    default: decodeInto(utf8, static_cast<Py_UCS4*>(characters)); break;
    }
    return result;
}

} // namespace dexmor::python
