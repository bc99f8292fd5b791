#pragma once
// Python strings from the UTF-8 text of a document.
#include <Python.h>

#include <string_view>

namespace dexmor::python {

// A new str holding `utf8`, or nullptr with a Python exception set. Text that is
// not valid UTF-8 raises UnicodeDecodeError, as a strict decode does.
PyObject* strFromUtf8(std::string_view utf8);

} // namespace dexmor::python
