// The Python extension module "Dexmor".
//
//   Dexmor.getZelmatXml(path) -> str   XML of a material library (".zelmat")
//   Dexmor.getZeloptXml(path) -> str   XML of a render-options file (".zelopt")
//   Dexmor.diagnose(path) -> str|None  why a file does not read as binary, or None
//   Dexmor.convert(path, *, kind, strict, max_output, out, wrap) -> str (None with out=)
//   Dexmor.convertWithDiagnosis(path, *, kind, max_output) -> (str, str|None)
//   Dexmor.convertBytes(data, kind, *, strict, max_output, wrap) -> str
//   Dexmor.convertBytesWithDiagnosis(data, kind, *, max_output) -> (str, str|None)
//   Dexmor.diagnoseBytes(data, kind) -> str|None
//   Dexmor.explain(path, *, kind) -> dict   every byte of the file, named
//   Dexmor.error                      raised when a path has the wrong extension,
//                                     a document exceeds its budget, or the
//                                     conversion fails unexpectedly
//   Dexmor.ReadError(error)           raised by strict conversions of a file that
//                                     does not read as binary
//
// The two getters pass a file that cannot be opened through as "", as they
// always have; the newer calls raise the OSError that open() would.
//
// The module only handles arguments and results; the conversion and the
// diagnosis are the core's, and run with the interpreter lock released.
#define PY_SSIZE_T_CLEAN
#include <Python.h>

#include "PythonText.hpp"
#include "Sinks.hpp"
#include <dexmor/dexmor.hpp>
#include <dexmor/version.hpp>
#include <dexmor/platform/Text.hpp>

#include <cerrno>
#include <cstring>
#include <exception>
#include <filesystem>
#include <new>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <unistd.h>

namespace {

namespace core = OrvexKavorCore;
namespace python = dexmor::python;

// Dexmor.error and Dexmor.ReadError. The module attributes hold one reference
// each, these statics another.
PyObject* moduleError = nullptr;
PyObject* readError = nullptr;

// An owned reference, released when it goes out of scope.
class Ref {
public:
    explicit Ref(PyObject* object) : object_(object) {}
    Ref(Ref&& other) noexcept : object_(std::exchange(other.object_, nullptr)) {}
    ~Ref() { Py_XDECREF(object_); }
    Ref(const Ref&) = delete;
    Ref& operator=(const Ref&) = delete;
    Ref& operator=(Ref&&) = delete;
    PyObject* get() const { return object_; }
    PyObject* release() { return std::exchange(object_, nullptr); }
    explicit operator bool() const { return object_ != nullptr; }

private:
    PyObject* object_;
};

// A buffer argument ("y*"), released when it goes out of scope.
struct HeldBuffer {
    Py_buffer view{};
    HeldBuffer() = default;
    HeldBuffer(const HeldBuffer&) = delete;
    HeldBuffer& operator=(const HeldBuffer&) = delete;
    ~HeldBuffer() {
        if (view.obj) PyBuffer_Release(&view);
    }
    core::Input input() const {
        const auto* bytes = static_cast<const char*>(view.buf);
        return core::Input::ofBytes(std::string_view(bytes, static_cast<std::size_t>(view.len)));
    }
};

struct Call {
    std::optional<core::FileKind> kind; // none: either kind, by the path's extension
    const char* name;
    const char* format; // "O:" + name, so argument errors name the function
};

constexpr Call zelmatCall{core::FileKind::MaterialLibrary, "getZelmatXml", "O:getZelmatXml"};
constexpr Call zeloptCall{core::FileKind::RenderOptions, "getZeloptXml", "O:getZeloptXml"};
constexpr Call diagnoseCall{std::nullopt, "diagnose", "O:diagnose"};

// A str of text that may not be valid UTF-8 (a reason may quote what it read).
PyObject* lenientText(std::string_view text) {
    return PyUnicode_DecodeUTF8(text.data(), static_cast<Py_ssize_t>(text.size()), "replace");
}

// Raises Dexmor.error with a message that may not be valid UTF-8.
void raiseModuleError(const char* message) noexcept {
    PyObject* text = lenientText(message);
    if (!text) return; // the decoder has set its own exception
    PyErr_SetObject(moduleError, text);
    Py_DECREF(text);
}

// Turns a C++ exception into the matching Python exception. The interpreter
// lock must be held.
void raiseFromCxx(std::exception_ptr failure) noexcept {
    try {
        std::rethrow_exception(std::move(failure));
    } catch (const python::Interrupted&) {
        // KeyboardInterrupt (or what the handler raised) is set already.
    } catch (const std::bad_alloc&) {
        PyErr_NoMemory();
    } catch (const std::exception& error) {
        raiseModuleError(error.what());
    } catch (...) {
        PyErr_SetString(moduleError, "the conversion failed for an unknown reason");
    }
}

// ---- arguments -----------------------------------------------------------------

// The path argument as a str: the str itself, or what an os.PathLike's
// __fspath__ returns. Bytes paths are not accepted. New reference, or nullptr
// with an exception set.
PyObject* pathAsText(PyObject* argument, const char* function) {
    if (PyUnicode_Check(argument)) {
        Py_INCREF(argument);
        return argument;
    }
    if (!PyBytes_Check(argument) && !PyByteArray_Check(argument) &&
        PyObject_HasAttrString(reinterpret_cast<PyObject*>(Py_TYPE(argument)), "__fspath__")) {
        PyObject* path = PyOS_FSPath(argument);
        if (!path || PyUnicode_Check(path)) return path;
        PyErr_Format(PyExc_TypeError, "%s() argument must be str or os.PathLike returning str, not %.200s returning %.200s",
                     function, Py_TYPE(argument)->tp_name, Py_TYPE(path)->tp_name);
        Py_DECREF(path);
        return nullptr;
    }
    PyErr_Format(PyExc_TypeError, "%s() argument must be str or os.PathLike, not %.200s", function,
                 Py_TYPE(argument)->tp_name);
    return nullptr;
}

// A path argument: the str the caller gave (or its __fspath__), and the path as
// the system sees it.
struct PathArgument {
    Ref text;
    std::string path;
};

// nullopt with an exception set when the argument is no acceptable path.
std::optional<PathArgument> pathArgument(PyObject* argument, const char* function) {
    Ref text(pathAsText(argument, function));
    if (!text) return std::nullopt;

    // As open() does: a NUL would silently shorten the path the system sees.
    const Py_ssize_t nul = PyUnicode_FindChar(text.get(), 0, 0, PyUnicode_GET_LENGTH(text.get()), 1);
    if (nul == -2) return std::nullopt;
    if (nul >= 0) {
        PyErr_SetString(PyExc_ValueError, "embedded null character");
        return std::nullopt;
    }

    // The file-system encoding with surrogate escapes, as open() encodes a str
    // path, so a name that is not valid UTF-8 still reaches its file.
    const Ref encoded(PyUnicode_EncodeFSDefault(text.get()));
    if (!encoded) return std::nullopt;
    std::string path(PyBytes_AS_STRING(encoded.get()), static_cast<std::size_t>(PyBytes_GET_SIZE(encoded.get())));
    return PathArgument{std::move(text), std::move(path)};
}

// A file argument: its path, and the kind it is converted as.
struct FileArgument {
    PathArgument path;
    core::FileKind kind;
};

// Parses the one path argument of a getter or diagnose() and checks its
// extension; nullopt with an exception set when it is not acceptable.
std::optional<FileArgument> fileArgument(PyObject* args, const Call& call) {
    PyObject* argument = nullptr;
    if (!PyArg_ParseTuple(args, call.format, &argument)) return std::nullopt;
    std::optional<PathArgument> path = pathArgument(argument, call.name);
    if (!path) return std::nullopt;

    if (call.kind) {
        const std::string extension(core::extensionOf(*call.kind));
        if (core::hasExtension(path->path, extension)) return FileArgument{std::move(*path), *call.kind};
        PyErr_Format(moduleError, "%s() expects a path ending in \".%s\" (in any letter case), got %R", call.name,
                     extension.c_str(), path->text.get());
        return std::nullopt;
    }
    if (const std::optional<core::FileKind> kind = core::fileKindOf(path->path))
        return FileArgument{std::move(*path), *kind};
    PyErr_Format(moduleError, "%s() expects a path ending in \".zelmat\" or \".zelopt\" (in any letter case), got %R",
                 call.name, path->text.get());
    return std::nullopt;
}

// The kind= argument: "zelmat" or "zelopt". nullopt with an exception set for
// anything else.
std::optional<core::FileKind> kindArgument(PyObject* argument, const char* function) {
    if (!PyUnicode_Check(argument)) {
        PyErr_Format(PyExc_TypeError, "%s() argument 'kind' must be str, not %.200s", function,
                     Py_TYPE(argument)->tp_name);
        return std::nullopt;
    }
    for (core::FileKind kind : {core::FileKind::MaterialLibrary, core::FileKind::RenderOptions})
        if (PyUnicode_CompareWithASCIIString(argument, std::string(core::extensionOf(kind)).c_str()) == 0) return kind;
    PyErr_Format(PyExc_ValueError, "%s() argument 'kind' must be \"zelmat\" or \"zelopt\", not %R", function, argument);
    return std::nullopt;
}

// A path argument with its kind: kind= when given, else the path's extension.
std::optional<FileArgument> fileArgument(PyObject* argument, PyObject* kind, const char* function) {
    std::optional<PathArgument> path = pathArgument(argument, function);
    if (!path) return std::nullopt;
    if (kind != Py_None) {
        const std::optional<core::FileKind> given = kindArgument(kind, function);
        if (!given) return std::nullopt;
        return FileArgument{std::move(*path), *given};
    }
    if (const std::optional<core::FileKind> named = core::fileKindOf(path->path))
        return FileArgument{std::move(*path), *named};
    PyErr_Format(moduleError,
                 "%s() expects a path ending in \".zelmat\" or \".zelopt\" (in any letter case) or a kind=, got %R",
                 function, path->text.get());
    return std::nullopt;
}

// The max_output= argument: None for the default budget, else a count of bytes
// (0: no limit). False with an exception set when it is none of these.
bool budgetArgument(PyObject* argument, const char* function, core::ConversionOptions& options) {
    if (argument == Py_None) return true;
    const Ref number(PyNumber_Index(argument));
    if (!number) return false;
    int overflow = 0;
    const long long value = PyLong_AsLongLongAndOverflow(number.get(), &overflow);
    if (overflow < 0 || (overflow == 0 && value < 0)) {
        PyErr_Format(PyExc_ValueError, "%s() argument 'max_output' must not be negative, got %R", function,
                     number.get());
        return false;
    }
    const unsigned long long bytes = PyLong_AsUnsignedLongLong(number.get());
    if (PyErr_Occurred()) return false;
    options.maxOutput = bytes;
    return true;
}

// ---- conversion ----------------------------------------------------------------

// Runs `work` with the interpreter lock released; its exception, if any, is
// thrown again once the lock is held. A sink's signal watch may look for
// signals meanwhile.
template <class Work>
void withoutInterpreterLock(Work&& work, python::SignalWatch* signals = nullptr) {
    std::exception_ptr failure;
    PyThreadState* state = PyEval_SaveThread();
    if (signals) signals->lockReleasedBy(state);
    try {
        work();
    } catch (...) {
        failure = std::current_exception();
    }
    if (signals) signals->lockReleasedBy(nullptr);
    PyEval_RestoreThread(state);
    if (failure) std::rethrow_exception(failure);
}

PyObject* textObject(std::string_view text) {
    return PyUnicode_DecodeUTF8(text.data(), static_cast<Py_ssize_t>(text.size()), "strict");
}

// Converts `input` with the interpreter lock released and returns the document
// as a str: the XML, the pass-through text, or "" when the diagnosis in `result`
// is not complete(). nullptr with an exception set when the str cannot be made
// or a signal handler raised. C++ exceptions leave it only while the lock is held.
PyObject* convertToStr(core::FileKind kind, const core::Input& input, const core::ConversionOptions& options,
                       core::Diagnosis& result) {
    python::SignalWatch signals;
    python::StrSink sink(signals);
    withoutInterpreterLock([&] { result = core::convert(kind, input, sink, options); }, &signals);
    if (!result.complete()) sink.takeBack();
    return sink.takeStr();
}

// The body of the getters: a file that cannot be opened gives "".
PyObject* convertFile(PyObject* args, const Call& call) {
    const std::optional<FileArgument> file = fileArgument(args, call);
    if (!file) return nullptr;
    core::Diagnosis result;
    Ref str(convertToStr(file->kind, std::filesystem::path(file->path.path), {}, result));
    if (!str) return nullptr;
    if (result.exceededBudget) {
        raiseModuleError((file->path.path + ": the XML would exceed " + std::to_string(*result.exceededBudget) +
                          " bytes (the output budget)").c_str());
        return nullptr;
    }
    return str.release();
}

PyObject* diagnoseFile(PyObject* args, const Call& call) {
    std::optional<FileArgument> file = fileArgument(args, call);
    if (!file) return nullptr;
    core::Diagnosis diagnosis;
    withoutInterpreterLock(
        [&] { diagnosis = core::diagnose(file->kind, std::filesystem::path(std::move(file->path.path))); });
    if (diagnosis.readsAsBinary) Py_RETURN_NONE;
    return textObject(diagnosis.reason());
}

// ---- what the newer calls raise ------------------------------------------------------

// The OSError that open() raises for the file at `path`: FileNotFoundError,
// PermissionError, IsADirectoryError... Its text is the system's words for the
// errno when the system refused, else what the reader found (a FIFO is "not a
// regular file", a file "changed while it was read").
void raiseUnopened(const core::Diagnosis& result, PyObject* path) {
    const int number = result.openError != 0 ? result.openError : EIO;
    const std::string system = std::strerror(number);
    const std::string reason = result.failure ? result.failure->reason : std::string();
    const bool systemSaidIt =
        reason.empty() || reason.ends_with(system) || core::text::equalsIgnoringAsciiCase(reason, system);
    const std::string& words = systemSaidIt ? system : reason;
    const Ref text(PyUnicode_DecodeLocale(words.c_str(), "surrogateescape"));
    if (!text) return;
    const Ref error(PyObject_CallFunction(PyExc_OSError, "iOO", number, text.get(), path ? path : Py_None));
    if (error) PyErr_SetObject(reinterpret_cast<PyObject*>(Py_TYPE(error.get())), error.get());
}

// Dexmor.ReadError for a file (at `path`, or bytes when it is nullptr) that
// does not read as binary, with the failure's parts as attributes.
void raiseReadError(const core::Diagnosis& result, PyObject* path) {
    const core::ReadFailure failure = result.failure.value_or(core::ReadFailure{"no reason was recorded", 0, {}});
    const Ref why(lenientText(result.reason()));
    const Ref reason(lenientText(failure.reason));
    const Ref offset(PyLong_FromUnsignedLongLong(failure.offset));
    const Ref records(PyList_New(0));
    if (!why || !reason || !offset || !records) return;
    for (const std::string& level : failure.recordPath) {
        const Ref record(lenientText(level));
        if (!record || PyList_Append(records.get(), record.get()) < 0) return;
    }
    const Ref message(path ? PyUnicode_FromFormat("%U: not readable as binary: %U", path, why.get())
                           : PyUnicode_FromFormat("not readable as binary: %U", why.get()));
    if (!message) return;
    const Ref error(PyObject_CallOneArg(readError, message.get()));
    if (!error) return;
    if (PyObject_SetAttrString(error.get(), "path", path ? path : Py_None) < 0 ||
        PyObject_SetAttrString(error.get(), "reason", reason.get()) < 0 ||
        PyObject_SetAttrString(error.get(), "offset", offset.get()) < 0 ||
        PyObject_SetAttrString(error.get(), "record_path", records.get()) < 0)
        return;
    PyErr_SetObject(readError, error.get());
}

// The result of a newer conversion call: the document, or (with the reason it
// did not read) the pair; raised instead: the OSError of a file that cannot be
// opened, Dexmor.error for a document over its budget, and with `strict`
// Dexmor.ReadError for a file that does not read as binary.
// True, with the exception set, when the result is one of those.
bool raisedForResult(const core::Diagnosis& result, PyObject* path, bool strict) {
    if (!result.opened) {
        raiseUnopened(result, path);
        return true;
    }
    if (result.exceededBudget) {
        const unsigned long long budget = *result.exceededBudget;
        if (path)
            PyErr_Format(moduleError, "%U: the XML would exceed %llu bytes (the output budget; max_output to change it)",
                         path, budget);
        else
            PyErr_Format(moduleError, "the XML would exceed %llu bytes (the output budget; max_output to change it)",
                         budget);
        return true;
    }
    if (strict && !result.readsAsBinary) {
        raiseReadError(result, path);
        return true;
    }
    return false;
}

PyObject* conversionResult(const core::Diagnosis& result, Ref str, PyObject* path, bool strict, bool withDiagnosis) {
    if (raisedForResult(result, path, strict)) return nullptr;
    if (!withDiagnosis) return str.release();
    const Ref reason(result.readsAsBinary ? Py_NewRef(Py_None) : lenientText(result.reason()));
    return reason ? PyTuple_Pack(2, str.get(), reason.get()) : nullptr;
}

// The arguments of the newer calls beyond the path or the data.
struct Keywords {
    PyObject* kind = Py_None;
    int strict = 0;
    PyObject* maxOutput = Py_None;
    PyObject* out = Py_None;
    int wrap = 0;
};

// convert(path, out=DEST): the document written to DEST, a path (the file takes
// its place only once the document is whole; on any failure an earlier file
// there is left as it was) or a binary file object (handed the document piece
// by piece: a library is read through first, so nothing is written for one that
// does not read; a document over its budget raises with part of it written).
// Returns None; raises as convert() does, and what the write raised.
PyObject* convertPathTo(const FileArgument& file, const core::ConversionOptions& given, const Keywords& keywords) {
    core::ConversionOptions options = given;
    const bool strict = keywords.strict != 0;
    options.passThrough = !strict; // a refused file writes nothing
    const std::filesystem::path input(file.path.path);
    python::SignalWatch signals;
    core::Diagnosis result;
    if (PyObject_HasAttrString(keywords.out, "write")) {
        const Ref write(PyObject_GetAttrString(keywords.out, "write"));
        if (!write) return nullptr;
        python::FileObjectSink sink(write.get(), signals);
        try {
            withoutInterpreterLock([&] { result = core::convert(file.kind, input, sink, options); }, &signals);
        } catch (const python::PythonRaised&) {
            sink.restoreError();
            return nullptr;
        }
        if (raisedForResult(result, file.path.text.get(), strict)) return nullptr;
        Py_RETURN_NONE;
    }
    std::optional<PathArgument> target = pathArgument(keywords.out, "convert");
    if (!target) return nullptr;
    python::PathSink sink(target->path, signals);
    withoutInterpreterLock([&] { result = core::convert(file.kind, input, sink, options); }, &signals);
    if (raisedForResult(result, file.path.text.get(), strict)) return nullptr;
    std::string error;
    bool committed = false;
    withoutInterpreterLock([&] { committed = sink.commit(&error); });
    if (!committed) {
        PyErr_Format(PyExc_OSError, "%U: the document could not be written: %s", target->text.get(), error.c_str());
        return nullptr;
    }
    Py_RETURN_NONE;
}

PyObject* convertPath(const char* function, PyObject* argument, const Keywords& given, bool withDiagnosis) {
    const std::optional<FileArgument> file = fileArgument(argument, given.kind, function);
    core::ConversionOptions options;
    if (!file || !budgetArgument(given.maxOutput, function, options)) return nullptr;
    options.wrap = given.wrap != 0;
    if (given.out != Py_None) return convertPathTo(*file, options, given);
    core::Diagnosis result;
    Ref str(convertToStr(file->kind, std::filesystem::path(file->path.path), options, result));
    if (!str) return nullptr;
    return conversionResult(result, std::move(str), file->path.text.get(), given.strict != 0, withDiagnosis);
}

// The buffer is held, so a bytearray cannot be resized, until the call returns.
PyObject* convertBuffer(const char* function, const HeldBuffer& data, const Keywords& given, bool withDiagnosis) {
    const std::optional<core::FileKind> kind = kindArgument(given.kind, function);
    core::ConversionOptions options;
    if (!kind || !budgetArgument(given.maxOutput, function, options)) return nullptr;
    options.wrap = given.wrap != 0;
    core::Diagnosis result;
    Ref str(convertToStr(*kind, data.input(), options, result));
    if (!str) return nullptr;
    return conversionResult(result, std::move(str), nullptr, given.strict != 0, withDiagnosis);
}

template <class Body>
PyObject* guarded(Body&& body) noexcept {
    try {
        return body();
    } catch (...) {
        raiseFromCxx(std::current_exception());
        return nullptr;
    }
}

PyObject* getZelmatXml(PyObject*, PyObject* args) noexcept {
    return guarded([&] { return convertFile(args, zelmatCall); });
}
PyObject* getZeloptXml(PyObject*, PyObject* args) noexcept {
    return guarded([&] { return convertFile(args, zeloptCall); });
}
PyObject* diagnose(PyObject*, PyObject* args) noexcept {
    return guarded([&] { return diagnoseFile(args, diagnoseCall); });
}

// Keyword lists: "" marks a positional-only argument.
char kPositional[] = "";
char kKind[] = "kind";
char kStrict[] = "strict";
char kMaxOutput[] = "max_output";
char kOut[] = "out";
char kWrap[] = "wrap";

PyObject* convert(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, kStrict, kMaxOutput, kOut, kWrap, nullptr};
        PyObject* path = nullptr;
        Keywords given;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "O|$OpOOp:convert", names, &path, &given.kind, &given.strict,
                                         &given.maxOutput, &given.out, &given.wrap))
            return nullptr;
        return convertPath("convert", path, given, false);
    });
}

PyObject* convertWithDiagnosis(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, kMaxOutput, nullptr};
        PyObject* path = nullptr;
        Keywords given;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "O|$OO:convertWithDiagnosis", names, &path, &given.kind,
                                         &given.maxOutput))
            return nullptr;
        return convertPath("convertWithDiagnosis", path, given, true);
    });
}

PyObject* convertBytes(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, kStrict, kMaxOutput, kWrap, nullptr};
        HeldBuffer data;
        Keywords given;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "y*O|$pOp:convertBytes", names, &data.view, &given.kind,
                                         &given.strict, &given.maxOutput, &given.wrap))
            return nullptr;
        return convertBuffer("convertBytes", data, given, false);
    });
}

PyObject* convertBytesWithDiagnosis(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, kMaxOutput, nullptr};
        HeldBuffer data;
        Keywords given;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "y*O|$O:convertBytesWithDiagnosis", names, &data.view,
                                         &given.kind, &given.maxOutput))
            return nullptr;
        return convertBuffer("convertBytesWithDiagnosis", data, given, true);
    });
}

PyObject* diagnoseBytes(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, nullptr};
        HeldBuffer data;
        PyObject* kindObject = nullptr;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "y*O:diagnoseBytes", names, &data.view, &kindObject))
            return nullptr;
        const std::optional<core::FileKind> kind = kindArgument(kindObject, "diagnoseBytes");
        if (!kind) return nullptr;
        core::Diagnosis diagnosis;
        withoutInterpreterLock([&] { diagnosis = core::diagnose(*kind, data.input()); });
        if (diagnosis.readsAsBinary) Py_RETURN_NONE;
        return textObject(diagnosis.reason());
    });
}

// ---- explain ----------------------------------------------------------------------------

// Sets dict[key] = value, taking the new reference `value`; false with an exception set.
bool setItem(PyObject* dict, const char* key, PyObject* value) {
    const Ref held(value);
    return held && PyDict_SetItemString(dict, key, held.get()) == 0;
}

// A node as a dict with the keys of `dexmor explain --json`.
PyObject* nodeDict(const core::ExplainedNode& node) {
    Ref dict(PyDict_New());
    if (!dict) return nullptr;
    PyObject* d = dict.get();
    if (!setItem(d, "offset", PyLong_FromUnsignedLongLong(node.offset)) ||
        !setItem(d, "size", PyLong_FromUnsignedLongLong(node.size)) || !setItem(d, "name", lenientText(node.name)) ||
        !setItem(d, "kind", lenientText(node.kind)) || !setItem(d, "value", lenientText(node.value)))
        return nullptr;
    const std::pair<const char*, const std::string*> optionalTexts[] = {
        {"encoding", &node.encoding}, {"hex", &node.hex},   {"class", &node.className},
        {"version", &node.version},   {"note", &node.note},
    };
    for (const auto& [key, text] : optionalTexts)
        if (!text->empty() && !setItem(d, key, lenientText(*text))) return nullptr;
    if (node.kindId && !setItem(d, "kind_id", PyLong_FromLong(*node.kindId))) return nullptr;
    if (node.heldSince && !setItem(d, "held_since", PyLong_FromLong(*node.heldSince))) return nullptr;
    if (node.heldUntil && !setItem(d, "held_until", PyLong_FromLong(*node.heldUntil))) return nullptr;
    Ref children(PyList_New(static_cast<Py_ssize_t>(node.children.size())));
    if (!children) return nullptr;
    for (std::size_t i = 0; i < node.children.size(); ++i) {
        PyObject* child = nodeDict(node.children[i]);
        if (!child) return nullptr;
        PyList_SET_ITEM(children.get(), static_cast<Py_ssize_t>(i), child);
    }
    if (!setItem(d, "children", children.release())) return nullptr;
    return dict.release();
}

PyObject* explain(PyObject*, PyObject* args, PyObject* kwargs) noexcept {
    return guarded([&]() -> PyObject* {
        static char* names[] = {kPositional, kKind, nullptr};
        PyObject* path = nullptr;
        PyObject* kind = Py_None;
        if (!PyArg_ParseTupleAndKeywords(args, kwargs, "O|$O:explain", names, &path, &kind)) return nullptr;
        const std::optional<FileArgument> file = fileArgument(path, kind, "explain");
        if (!file) return nullptr;
        core::Explanation explanation;
        withoutInterpreterLock(
            [&] { explanation = core::explain(file->kind, std::filesystem::path(file->path.path)); });
        if (!explanation.opened) {
            core::Diagnosis unopened;
            unopened.failure = explanation.failure;
            unopened.openError = explanation.openError;
            raiseUnopened(unopened, file->path.text.get());
            return nullptr;
        }
        Ref dict(nodeDict(explanation.root));
        if (!dict) return nullptr;
        PyObject* d = dict.get();
        Py_INCREF(file->path.text.get());
        if (!setItem(d, "path", file->path.text.get()) ||
            !setItem(d, "file_kind", lenientText(core::extensionOf(file->kind))) ||
            !setItem(d, "reads_as_binary", PyBool_FromLong(explanation.readsAsBinary)))
            return nullptr;
        if (explanation.failure) {
            Ref failure(PyDict_New());
            Ref records(PyList_New(0));
            if (!failure || !records) return nullptr;
            for (const std::string& level : explanation.failure->recordPath) {
                const Ref record(lenientText(level));
                if (!record || PyList_Append(records.get(), record.get()) < 0) return nullptr;
            }
            if (!setItem(failure.get(), "reason", lenientText(explanation.failure->reason)) ||
                !setItem(failure.get(), "offset", PyLong_FromUnsignedLongLong(explanation.failure->offset)) ||
                !setItem(failure.get(), "record_path", records.release()) || !setItem(d, "failure", failure.release()))
                return nullptr;
        } else {
            Py_INCREF(Py_None);
            if (!setItem(d, "failure", Py_None)) return nullptr;
        }
        if (!setItem(d, "cut", PyBool_FromLong(explanation.cut))) return nullptr;
        return dict.release();
    });
}

template <PyObject* (*Function)(PyObject*, PyObject*, PyObject*) noexcept>
PyCFunction withKeywords() {
    return reinterpret_cast<PyCFunction>(reinterpret_cast<void (*)()>(Function));
}

// The first line of each newer docstring is its signature, for inspect.signature().
PyMethodDef methods[] = {
    // The lines before "--" are the signature inspect and help() show; __doc__ is
    // what follows, the documented first line unchanged.
    {"getZelmatXml", getZelmatXml, METH_VARARGS, "getZelmatXml($module, path, /)\n--\n\nGets the xml from a zelmat file."},
    {"getZeloptXml", getZeloptXml, METH_VARARGS, "getZeloptXml($module, path, /)\n--\n\nGets the xml from a zelopt file."},
    {"diagnose", diagnose, METH_VARARGS,
     "diagnose($module, path, /)\n--\n\n"
     "None when the file reads as a binary file of the kind its extension names\n"
     "(.zelmat or .zelopt); otherwise why not: the record, the byte offset and what\nwas wrong there."},
    {"convert", withKeywords<convert>(), METH_VARARGS | METH_KEYWORDS,
     "convert($module, path, /, *, kind=None, strict=False, max_output=None, out=None, wrap=False)\n--\n\n"
     "The XML document of the file at `path`, of the kind its extension names\n"
     "(.zelmat or .zelopt, any letter case) unless kind= (\"zelmat\" or \"zelopt\") says.\n"
     "A file that does not read as binary comes back as its own text; with strict=True\n"
     "it raises ReadError instead. A file that cannot be opened raises what open()\n"
     "raises (FileNotFoundError, PermissionError, IsADirectoryError...). max_output is\n"
     "the output budget in bytes (None: the larger of 256 MiB and 1,000 times the\n"
     "file's size; 0: none); a document over it raises error. With out= (a path or a\n"
     "binary file object) the document is written there instead and None returned.\n"
     "wrap=True gives the wrapped form: one well-formed XML document (a declaration\n"
     "and the root <AssetDocument>), U+FFFD for each character XML 1.0 cannot carry."},
    {"convertWithDiagnosis", withKeywords<convertWithDiagnosis>(), METH_VARARGS | METH_KEYWORDS,
     "convertWithDiagnosis($module, path, /, *, kind=None, max_output=None)\n--\n\n"
     "(text, reason) from one reading of the file at `path`: text as convert() returns\n"
     "it, and reason None when the file read as binary, else why it did not (as\n"
     "diagnose() gives it). Raises as convert() does."},
    {"convertBytes", withKeywords<convertBytes>(), METH_VARARGS | METH_KEYWORDS,
     "convertBytes($module, data, /, kind, *, strict=False, max_output=None, wrap=False)\n--\n\n"
     "The XML document of a file's bytes held in memory (bytes, bytearray, memoryview\n"
     "or any contiguous buffer), converted in place as kind (\"zelmat\" or \"zelopt\").\n"
     "Otherwise as convert(); ReadError.path is None."},
    {"convertBytesWithDiagnosis", withKeywords<convertBytesWithDiagnosis>(), METH_VARARGS | METH_KEYWORDS,
     "convertBytesWithDiagnosis($module, data, /, kind, *, max_output=None)\n--\n\n"
     "(text, reason) from one reading of a file's bytes, as convertWithDiagnosis()\n"
     "gives them for a file."},
    {"diagnoseBytes", withKeywords<diagnoseBytes>(), METH_VARARGS | METH_KEYWORDS,
     "diagnoseBytes($module, data, /, kind)\n--\n\n"
     "None when the bytes read as a binary file of kind (\"zelmat\" or \"zelopt\");\n"
     "otherwise why not, as diagnose() says it."},
    {"explain", withKeywords<explain>(), METH_VARARGS | METH_KEYWORDS,
     "explain($module, path, /, *, kind=None)\n--\n\n"
     "Every byte of the file at `path` as its reader reads it, as the dict that\n"
     "`dexmor explain --json` prints: a tree of nodes with offset, size, name, kind,\n"
     "value and children (a value's encoding, hex bytes; a record's kind_id, class,\n"
     "version), and at the top path, file_kind, reads_as_binary, failure and cut.\n"
     "kind= as for convert(). A file that cannot be opened raises what open() raises."},
    {nullptr, nullptr, 0, nullptr},
};

PyModuleDef moduleDefinition = {
    PyModuleDef_HEAD_INIT,
    "Dexmor", // m_name
    nullptr,  // m_doc: the module has no docstring (its stub Dexmor.pyi describes it)
    -1,       // m_size: state lives in statics
    methods,  // m_methods
    nullptr,  // m_slots
    nullptr,  // m_traverse
    nullptr,  // m_clear
    nullptr,  // m_free
};

// Adds a new exception class to the module and keeps a reference in `slot`.
bool addException(PyObject* module, const char* name, const char* qualifiedName, const char* doc, PyObject* base,
                  PyObject*& slot) {
    PyObject* type = PyErr_NewExceptionWithDoc(qualifiedName, doc, base, nullptr);
    if (!type) return false;
    if (PyModule_AddObjectRef(module, name, type) < 0) {
        Py_DECREF(type);
        return false;
    }
    Py_XSETREF(slot, type);
    return true;
}

} // namespace

PyMODINIT_FUNC PyInit_Dexmor() {
    PyObject* module = PyModule_Create(&moduleDefinition);
    if (!module) return nullptr;
    if (PyModule_AddStringConstant(module, "__version__", DEXMOR_VERSION_STRING) < 0 ||
        !addException(module, "error", "Dexmor.error", nullptr, nullptr, moduleError) ||
        !addException(module, "ReadError", "Dexmor.ReadError",
                      "A file that does not read as binary, in a strict conversion. Attributes: path\n"
                      "(None for bytes), reason, offset and record_path (a list of str).",
                      moduleError, readError)) {
        Py_DECREF(module);
        return nullptr;
    }
    return module;
}
