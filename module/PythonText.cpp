#include "PythonText.hpp"

#include "platform/HugePages.hpp"
#include <dexmor/platform/Text.hpp>

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace dexmor::python {

namespace {

namespace core = OrvexKavorCore;

constexpr std::uint64_t kHighBits = 0x8080808080808080ull;

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

// Decodes UTF-8 into characters of type Unit up to `limit`, checking it as it
// goes (no overlong forms, surrogates or code points above U+10FFFF).
template <class Unit>
Decoded decodeChecked(std::string_view utf8, Unit* out, Py_UCS4 limit) {
    const auto* const begin = reinterpret_cast<const std::uint8_t*>(utf8.data());
    const std::uint8_t* p = begin;
    const std::uint8_t* const end = p + utf8.size();
    Unit* o = out;
    const auto stop = [&](Py_UCS4 wider, bool invalid) {
        return Decoded{static_cast<std::size_t>(p - begin), static_cast<std::size_t>(o - out), wider, invalid};
    };
    while (p < end) {
        // A run of ASCII, found a word at a time, goes over in one copy.
        const std::uint8_t* run = p;
        for (std::uint64_t word; end - run >= 8 && (std::memcpy(&word, run, 8), (word & kHighBits) == 0);) run += 8;
        if (run != p) {
            if constexpr (sizeof(Unit) == 1)
                std::memcpy(o, p, static_cast<std::size_t>(run - p));
            else
                std::copy(p, run, o);
            o += run - p;
            p = run;
            continue;
        }
        const std::uint32_t lead = *p;
        if (lead < 0x80) {
            *o++ = static_cast<Unit>(lead);
            ++p;
            continue;
        }
        std::size_t length;
        Py_UCS4 c;
        if (lead >= 0xC2 && lead <= 0xDF)
            length = 2, c = lead & 0x1F;
        else if (lead >= 0xE0 && lead <= 0xEF)
            length = 3, c = lead & 0x0F;
        else if (lead >= 0xF0 && lead <= 0xF4)
            length = 4, c = lead & 0x07;
        else
            return stop(0, true);
        if (static_cast<std::size_t>(end - p) < length) return stop(0, true);
        for (std::size_t i = 1; i < length; ++i) {
            if ((p[i] & 0xC0) != 0x80) return stop(0, true);
            c = (c << 6) | (p[i] & 0x3F);
        }
        const bool overlong = (length == 3 && c < 0x800) || (length == 4 && c < 0x10000);
        if (overlong || (c >= 0xD800 && c <= 0xDFFF) || c > 0x10FFFF) return stop(0, true);
        if (c > limit) return stop(c, false);
        *o++ = static_cast<Unit>(c);
        p += length;
    }
    return stop(0, false);
}

} // namespace

Decoded decodeAt(PyObject* str, std::size_t at, std::string_view utf8) {
    const auto kind = static_cast<std::size_t>(PyUnicode_KIND(str));
    void* characters = static_cast<char*>(PyUnicode_DATA(str)) + at * kind;
    if (PyUnicode_IS_ASCII(str)) return decodeChecked(utf8, static_cast<Py_UCS1*>(characters), 0x7F);
    if (kind == PyUnicode_1BYTE_KIND) return decodeChecked(utf8, static_cast<Py_UCS1*>(characters), 0xFF);
    if (kind == PyUnicode_2BYTE_KIND) return decodeChecked(utf8, static_cast<Py_UCS2*>(characters), 0xFFFF);
    return decodeChecked(utf8, static_cast<Py_UCS4*>(characters), 0x10FFFF);
}

// A str's length counts code points, and its width follows its largest one.
// Both are read off the lead bytes: every byte but a continuation byte
// (10xxxxxx) starts a character, and the largest lead byte bounds the largest
// character (continuation bytes lie below any lead byte of a multi-byte sequence).
std::optional<StrShape> measureUtf8(std::string_view utf8) {
    StrShape shape;
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
    if (largest < 0x80) return shape;
    if (!core::text::isValidUtf8(utf8)) return std::nullopt;
    if (largest < 0xC4) // C2 and C3 lead U+0080 to U+00FF
        shape.maxChar = 0xFF;
    else if (largest < 0xF0)
        shape.maxChar = 0xFFFF;
    else
        shape.maxChar = 0x10FFFF;
    return shape;
}

PyObject* newStr(const StrShape& shape) {
    return PyUnicode_New(static_cast<Py_ssize_t>(shape.characters), shape.maxChar);
}

void fillStr(PyObject* str, std::string_view utf8) {
    // A large document's str is filled in memory that faults in huge pages.
    core::adviseHugePages(PyUnicode_DATA(str),
                          static_cast<std::size_t>(PyUnicode_GET_LENGTH(str)) * PyUnicode_KIND(str));
    void* characters = PyUnicode_DATA(str);
    const auto kind = PyUnicode_KIND(str);
    if (PyUnicode_IS_ASCII(str))
        std::memcpy(characters, utf8.data(), utf8.size());
    else if (kind == PyUnicode_1BYTE_KIND)
        decodeInto(utf8, static_cast<Py_UCS1*>(characters));
    else if (kind == PyUnicode_2BYTE_KIND)
        decodeInto(utf8, static_cast<Py_UCS2*>(characters));
    else
        decodeInto(utf8, static_cast<Py_UCS4*>(characters));
}

} // namespace dexmor::python
