#pragma once
// Python strings from the UTF-8 text of a document, made in three steps so that
// only the allocation needs the interpreter lock: the text is measured and the
// characters are filled in while other threads run.
#include <Python.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace dexmor::python {

// What a str of a text needs: its length in code points, and the largest code
// point it may hold (which sets its width of 1, 2 or 4 bytes a character).
struct StrShape {
    std::size_t characters = 0;
    Py_UCS4 maxChar = 0x7F;
};

// The shape of a str holding `utf8`; nullopt when the text is not valid UTF-8.
// Needs no interpreter lock.
std::optional<StrShape> measureUtf8(std::string_view utf8);

// A new str of that shape, its characters not yet set; nullptr with a Python
// exception set when there is no memory. Needs the interpreter lock.
PyObject* newStr(const StrShape& shape);

// Sets the characters of a str from newStr() to those of the text it was measured
// from. Needs no interpreter lock: nothing else can see the str yet.
void fillStr(PyObject* str, std::string_view utf8);

// What decodeAt() did: the bytes of `utf8` it decoded into how many characters;
// where it stopped early, the character the str is too narrow for (`wider`), or
// that the text is not valid UTF-8 there (`invalid`).
struct Decoded {
    std::size_t bytes = 0;
    std::size_t characters = 0;
    Py_UCS4 wider = 0;
    bool invalid = false;
};

// Decodes UTF-8 into the characters of a new str from index `at` on, as far as
// the str's width holds them and the text is valid; the str must have room for
// as many characters as `utf8` has bytes. Needs no interpreter lock.
Decoded decodeAt(PyObject* str, std::size_t at, std::string_view utf8);

} // namespace dexmor::python
