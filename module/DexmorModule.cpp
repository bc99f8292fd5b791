// The Python extension module "Dexmor".
//
//   Dexmor.getZelmatXml(path) -> str   XML of a material library (".zelmat")
//   Dexmor.getZeloptXml(path) -> str   XML of a render-options file (".zelopt")
//   Dexmor.diagnose(path) -> str|None  why a file does not read as binary, or None
//   Dexmor.error                      raised when a path has the wrong extension
//                                     or the conversion fails unexpectedly
//
// The module only handles arguments and results; the conversion and the
// diagnosis are the core's, and run with the interpreter lock released.
#define PY_SSIZE_T_CLEAN
#include <Python.h>

#include "PythonText.hpp"
#include <dexmor/dexmor.hpp>
#include <dexmor/version.hpp>
#include <dexmor/platform/Text.hpp>

#include <chrono>
#include <cstring>
#include <exception>
#include <filesystem>
#include <new>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <utility>

#include <sys/syscall.h>
#include <unistd.h>

namespace {

namespace core = OrvexKavorCore;
namespace python = dexmor::python;

// Dexmor.error. The module attribute holds one reference, this static another.
PyObject* moduleError = nullptr;

// An owned reference, released when it goes out of scope.
class Ref {
public:
    explicit Ref(PyObject* object) : object_(object) {}
    ~Ref() { Py_XDECREF(object_); }
    Ref(const Ref&) = delete;
    Ref& operator=(const Ref&) = delete;
    PyObject* get() const { return object_; }
    explicit operator bool() const { return object_ != nullptr; }

private:
    PyObject* object_;
};

struct Call {
    std::optional<core::FileKind> kind; // none: either kind, by the path's extension
    const char* name;
    const char* format; // "O:" + name, so argument errors name the function
};

constexpr Call zelmatCall{core::FileKind::MaterialLibrary, "getZelmatXml", "O:getZelmatXml"};
constexpr Call zeloptCall{core::FileKind::RenderOptions, "getZeloptXml", "O:getZeloptXml"};
constexpr Call diagnoseCall{std::nullopt, "diagnose", "O:diagnose"};

// Raises Dexmor.error with a message that may not be valid UTF-8.
void raiseModuleError(const char* message) noexcept {
    PyObject* text = PyUnicode_DecodeUTF8(message, static_cast<Py_ssize_t>(std::strlen(message)), "replace");
    if (!text) return; // the decoder has set its own exception
    PyErr_SetObject(moduleError, text);
    Py_DECREF(text);
}

// Thrown when a signal handler raised an exception during a call: the
// interpreter holds that exception already.
struct Interrupted {};

// Turns a C++ exception into the matching Python exception. The interpreter
// lock must be held.
void raiseFromCxx(std::exception_ptr failure) noexcept {
    try {
        std::rethrow_exception(std::move(failure));
    } catch (const Interrupted&) {
        // KeyboardInterrupt (or what the handler raised) is set already.
    } catch (const std::bad_alloc&) {
        PyErr_NoMemory();
    } catch (const std::exception& error) {
        raiseModuleError(error.what());
    } catch (...) {
        PyErr_SetString(moduleError, "the conversion failed for an unknown reason");
    }
}

// The path argument as a str: the str itself, or what an os.PathLike's
// __fspath__ returns. Bytes paths are not accepted. New reference, or nullptr
// with an exception set.
PyObject* pathAsText(PyObject* argument, const Call& call) {
    if (PyUnicode_Check(argument)) {
        Py_INCREF(argument);
        return argument;
    }
    if (!PyBytes_Check(argument) && !PyByteArray_Check(argument) &&
        PyObject_HasAttrString(reinterpret_cast<PyObject*>(Py_TYPE(argument)), "__fspath__")) {
        PyObject* path = PyOS_FSPath(argument);
        if (!path || PyUnicode_Check(path)) return path;
        PyErr_Format(PyExc_TypeError, "%s() argument must be str or os.PathLike returning str, not %.200s returning %.200s",
                     call.name, Py_TYPE(argument)->tp_name, Py_TYPE(path)->tp_name);
        Py_DECREF(path);
        return nullptr;
    }
    PyErr_Format(PyExc_TypeError, "%s() argument must be str or os.PathLike, not %.200s", call.name,
                 Py_TYPE(argument)->tp_name);
    return nullptr;
}

// A file argument: its path as the system sees it, and the kind it names.
struct FileArgument {
    std::string path;
    core::FileKind kind;
};

// Parses the one path argument of a call and checks its extension; nullopt with
// an exception set when it is not acceptable.
std::optional<FileArgument> fileArgument(PyObject* args, const Call& call) {
    PyObject* argument = nullptr;
    if (!PyArg_ParseTuple(args, call.format, &argument)) return std::nullopt;
    const Ref text(pathAsText(argument, call));
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

    if (call.kind) {
        const std::string extension(core::extensionOf(*call.kind));
        if (core::hasExtension(path, extension)) return FileArgument{std::move(path), *call.kind};
        PyErr_Format(moduleError, "%s() expects a path ending in \".%s\" (in any letter case), got %R", call.name,
                     extension.c_str(), text.get());
        return std::nullopt;
    }
    if (const std::optional<core::FileKind> kind = core::fileKindOf(path)) return FileArgument{std::move(path), *kind};
    PyErr_Format(moduleError, "%s() expects a path ending in \".zelmat\" or \".zelopt\" (in any letter case), got %R",
                 call.name, text.get());
    return std::nullopt;
}

// A document in a string whose conversion stops when a signal handler raises:
// between pieces it runs the pending handlers (Ctrl-C's KeyboardInterrupt),
// taking the interpreter lock only for that. Handlers run on the main thread
// only, so only a call there looks, and at most ten times a second: the lock
// may have to wait for other threads.
class InterruptibleText final : public core::StringSink {
public:
    explicit InterruptibleText(std::string& text) : StringSink(text), thread_(std::this_thread::get_id()) {}

    // The thread state the lock was released from, while it is released.
    void lockReleasedBy(PyThreadState* state) { released_ = state; }

    void checkpoint() override {
        // A deep conversion runs on a thread of its own, where the lock cannot be taken for this thread.
        if (!released_ || !onMainThread() || std::this_thread::get_id() != thread_) return;
        const auto now = std::chrono::steady_clock::now();
        if (now < nextLook_) return;
        nextLook_ = now + std::chrono::milliseconds(100);
        PyEval_RestoreThread(released_);
        const bool raised = PyErr_CheckSignals() != 0;
        released_ = PyEval_SaveThread();
        if (raised) throw Interrupted{};
    }

private:
    static bool onMainThread() { return ::getpid() == static_cast<pid_t>(::syscall(SYS_gettid)); }

    std::thread::id thread_;
    PyThreadState* released_ = nullptr;
    std::chrono::steady_clock::time_point nextLook_ = std::chrono::steady_clock::now() + std::chrono::milliseconds(100);
};

// Runs `work` with the interpreter lock released; its exception, if any, is
// thrown again once the lock is held. A given sink may look for signals meanwhile.
template <class Work>
void withoutInterpreterLock(Work&& work, InterruptibleText* sink = nullptr) {
    std::exception_ptr failure;
    PyThreadState* state = PyEval_SaveThread();
    if (sink) sink->lockReleasedBy(state);
    try {
        work();
    } catch (...) {
        failure = std::current_exception();
    }
    if (sink) sink->lockReleasedBy(nullptr);
    PyEval_RestoreThread(state);
    if (failure) std::rethrow_exception(failure);
}

PyObject* textObject(std::string_view text) {
    return PyUnicode_DecodeUTF8(text.data(), static_cast<Py_ssize_t>(text.size()), "strict");
}

// The body of the conversion calls. C++ exceptions leave it only while the
// interpreter lock is held.
PyObject* convertFile(PyObject* args, const Call& call) {
    std::optional<FileArgument> file = fileArgument(args, call);
    if (!file) return nullptr;
    // Each thread keeps a small text buffer between calls, so converting many
    // small files does not map, fault in and unmap fresh memory for each; the
    // buffer of a larger document is let go, so that a pool of idle threads
    // holds a few MiB each at most.
    constexpr std::size_t kKeptCapacity = std::size_t{4} << 20;
    thread_local std::string xml;
    xml.clear();
    struct LetGoOfLargeBuffer {
        ~LetGoOfLargeBuffer() {
            if (xml.capacity() > kKeptCapacity) std::string().swap(xml);
        }
    } letGo;
    // Only making the str object needs the lock: the conversion, measuring the
    // text and filling in the characters run while other threads do.
    std::string_view text;
    std::optional<python::StrShape> shape;
    core::Diagnosis result;
    InterruptibleText sink(xml);
    withoutInterpreterLock(
        [&] {
            result = core::convert(file->kind, std::filesystem::path(file->path), sink);
            text = core::text::upToFirstNul(xml);
            shape = python::measureUtf8(text);
        },
        &sink);
    if (result.exceededBudget) {
        raiseModuleError((file->path + ": the XML would exceed " + std::to_string(*result.exceededBudget) +
                          " bytes (the output budget)").c_str());
        return nullptr;
    }
    PyObject* str = shape ? python::newStr(*shape) : textObject(text);
    if (str && shape) withoutInterpreterLock([&] { python::fillStr(str, text); });
    return str;
}

PyObject* diagnoseFile(PyObject* args, const Call& call) {
    std::optional<FileArgument> file = fileArgument(args, call);
    if (!file) return nullptr;
    core::Diagnosis diagnosis;
    withoutInterpreterLock([&] { diagnosis = core::diagnose(file->kind, std::filesystem::path(std::move(file->path))); });
    if (diagnosis.readsAsBinary) Py_RETURN_NONE;
    return textObject(diagnosis.reason());
}

template <PyObject* (*Body)(PyObject*, const Call&)>
PyObject* guarded(PyObject* args, const Call& call) noexcept {
    try {
        return Body(args, call);
    } catch (...) {
        raiseFromCxx(std::current_exception());
        return nullptr;
    }
}

PyObject* getZelmatXml(PyObject*, PyObject* args) noexcept { return guarded<convertFile>(args, zelmatCall); }
PyObject* getZeloptXml(PyObject*, PyObject* args) noexcept { return guarded<convertFile>(args, zeloptCall); }
PyObject* diagnose(PyObject*, PyObject* args) noexcept { return guarded<diagnoseFile>(args, diagnoseCall); }

PyMethodDef methods[] = {
    {"getZelmatXml", getZelmatXml, METH_VARARGS, "Gets the xml from a zelmat file."},
    {"getZeloptXml", getZeloptXml, METH_VARARGS, "Gets the xml from a zelopt file."},
    {"diagnose", diagnose, METH_VARARGS,
     "diagnose(path) -> str | None\n\nNone when the file reads as a binary file of the kind its extension names\n"
     "(.zelmat or .zelopt); otherwise why not: the record, the byte offset and what\nwas wrong there."},
    {nullptr, nullptr, 0, nullptr},
};

PyModuleDef moduleDefinition = {
    PyModuleDef_HEAD_INIT,
    "Dexmor", // m_name
    nullptr,  // m_doc: the module has no docstring
    -1,       // m_size: state lives in statics
    methods,  // m_methods
    nullptr,  // m_slots
    nullptr,  // m_traverse
    nullptr,  // m_clear
    nullptr,  // m_free
};

} // namespace

PyMODINIT_FUNC PyInit_Dexmor() {
    PyObject* module = PyModule_Create(&moduleDefinition);
    if (!module) return nullptr;
    if (PyModule_AddStringConstant(module, "__version__", DEXMOR_VERSION_STRING) < 0) {
        Py_DECREF(module);
        return nullptr;
    }

    PyObject* error = PyErr_NewException("Dexmor.error", nullptr, nullptr);
    if (!error) {
        Py_DECREF(module);
        return nullptr;
    }
    Py_INCREF(error); // the module attribute's reference; PyModule_AddObject takes it on success
    if (PyModule_AddObject(module, "error", error) < 0) {
        Py_DECREF(error);
        Py_DECREF(error);
        Py_DECREF(module);
        return nullptr;
    }
    PyObject* previous = moduleError;
    moduleError = error;
    Py_XDECREF(previous);
    return module;
}
