#include "Sinks.hpp"

#include "PythonText.hpp"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <new>
#include <stdexcept>
#include <optional>
#include <utility>

#include <sys/syscall.h>
#include <unistd.h>

namespace dexmor::python {

namespace {

// The interpreter lock for the scope, from whichever thread: the caller's (whose
// thread state released it) or a thread of the conversion's own.
class LockHeld {
public:
    LockHeld() : state_(PyGILState_Ensure()) {}
    ~LockHeld() { PyGILState_Release(state_); }
    LockHeld(const LockHeld&) = delete;
    LockHeld& operator=(const LockHeld&) = delete;

private:
    PyGILState_STATE state_;
};

bool onMainThread() { return ::getpid() == static_cast<pid_t>(::syscall(SYS_gettid)); }

} // namespace

// ---- SignalWatch -----------------------------------------------------------------

SignalWatch::SignalWatch()
    : thread_(std::this_thread::get_id()), nextLook_(std::chrono::steady_clock::now() + std::chrono::milliseconds(100)) {}

void SignalWatch::look() {
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

// ---- StrSink ---------------------------------------------------------------------

namespace {

// The bytes of the UTF-8 sequence that `lead` begins (1 for a stray byte, which
// the validation then refuses).
std::size_t sequenceLength(char lead) {
    const auto b = static_cast<unsigned char>(lead);
    if (b >= 0xF0) return 4;
    if (b >= 0xE0) return 3;
    if (b >= 0xC0) return 2;
    return 1;
}

// The length of the longest beginning of `text` that ends with a whole character.
std::size_t wholeCharacters(std::string_view text) {
    for (std::size_t back = 1; back <= std::min<std::size_t>(4, text.size()); ++back) {
        const char c = text[text.size() - back];
        if ((static_cast<unsigned char>(c) & 0xC0) == 0x80) continue; // a continuation byte
        return sequenceLength(c) > back ? text.size() - back : text.size();
    }
    return text.size();
}

} // namespace

void StrSink::write(std::string_view piece) {
    if (cut_) return;
    if (const void* nul = std::memchr(piece.data(), 0, piece.size())) {
        piece = piece.substr(0, static_cast<std::size_t>(static_cast<const char*>(nul) - piece.data()));
        cut_ = true;
    }
    // A piece may end inside a character; its first bytes then wait for the next.
    if (pendingLength_ > 0) {
        const std::size_t missing = sequenceLength(pending_[0]) - pendingLength_;
        const std::size_t taken = std::min(missing, piece.size());
        std::memcpy(pending_ + pendingLength_, piece.data(), taken);
        pendingLength_ += taken;
        piece.remove_prefix(taken);
        if (taken < missing) return;
        append(std::string_view(pending_, pendingLength_));
        pendingLength_ = 0;
    }
    const std::size_t whole = wholeCharacters(piece);
    append(piece.substr(0, whole));
    pendingLength_ = piece.size() - whole;
    std::memcpy(pending_, piece.data() + whole, pendingLength_);
}

void StrSink::append(std::string_view utf8) {
    while (!utf8.empty()) {
        if (utf8.size() > capacity_ - length_) reserve(utf8.size()); // no more characters than bytes
        const Decoded decoded = decodeAt(str_, length_, utf8);
        if (decoded.invalid) throw std::runtime_error("the document is not valid UTF-8");
        length_ += decoded.characters;
        utf8.remove_prefix(decoded.bytes);
        if (decoded.wider) widen(decoded.wider <= 0xFF ? 0xFF : decoded.wider <= 0xFFFF ? 0xFFFF : 0x10FFFF);
    }
}

void StrSink::expect(std::size_t bytes) {
    constexpr std::size_t kMostAhead = std::size_t{64} << 20;
    if (!str_) reserve(std::min(bytes, kMostAhead));
}

void StrSink::reserve(std::size_t more) {
    constexpr std::size_t kFirstCapacity = 64 * 1024;
    const std::size_t grown = std::max({length_ + more, capacity_ + capacity_ / 4, kFirstCapacity});
    if (grown > static_cast<std::size_t>(PY_SSIZE_T_MAX) / 4) throw std::bad_alloc();
    const LockHeld lock;
    // A str nobody else has seen may be resized in place; a large one is
    // reallocated by remapping its pages, without copying them.
    const bool grew = str_ ? PyUnicode_Resize(&str_, static_cast<Py_ssize_t>(grown)) == 0
                           : (str_ = PyUnicode_New(static_cast<Py_ssize_t>(grown), maxChar_)) != nullptr;
    if (!grew) {
        PyErr_Clear();
        throw std::bad_alloc();
    }
    capacity_ = grown;
}

void StrSink::widen(Py_UCS4 maxChar) {
    if (!str_) {
        maxChar_ = maxChar; // reserve() makes it at this width
        return;
    }
    const LockHeld lock;
    PyObject* wider = PyUnicode_New(static_cast<Py_ssize_t>(capacity_), maxChar);
    if (!wider || (length_ > 0 && PyUnicode_CopyCharacters(wider, 0, str_, 0, static_cast<Py_ssize_t>(length_)) < 0)) {
        Py_XDECREF(wider);
        PyErr_Clear();
        throw std::bad_alloc();
    }
    Py_XSETREF(str_, wider);
    maxChar_ = maxChar;
}

void StrSink::drop() {
    const LockHeld lock;
    Py_CLEAR(str_);
}

void StrSink::takeBack() {
    // The text that replaces a taken-back document may be narrower: it starts
    // again as ASCII, so that the str keeps the width its characters need.
    if (maxChar_ > 0x7F) {
        drop();
        maxChar_ = 0x7F;
        capacity_ = 0;
    }
    length_ = 0;
    pendingLength_ = 0;
    cut_ = false;
}

PyObject* StrSink::takeStr() {
    if (pendingLength_ > 0) {
        PyErr_SetString(PyExc_ValueError, "the document ends inside a UTF-8 character");
        return nullptr;
    }
    if (!str_) return PyUnicode_New(0, 0x7F);
    // Shrinking to the written length gives back the room grown ahead.
    if (PyUnicode_Resize(&str_, static_cast<Py_ssize_t>(length_)) < 0) return nullptr;
    return std::exchange(str_, nullptr);
}

// ---- FileObjectSink --------------------------------------------------------------

FileObjectSink::~FileObjectSink() {
    Py_XDECREF(errorType_);
    Py_XDECREF(errorValue_);
    Py_XDECREF(errorTrace_);
}

void FileObjectSink::write(std::string_view piece) {
    const LockHeld lock;
    // A raw file may take fewer bytes than it is given: it is given the rest again.
    while (!piece.empty()) {
        PyObject* bytes = PyBytes_FromStringAndSize(piece.data(), static_cast<Py_ssize_t>(piece.size()));
        PyObject* written = bytes ? PyObject_CallOneArg(write_, bytes) : nullptr;
        Py_XDECREF(bytes);
        if (!written) {
            PyErr_Fetch(&errorType_, &errorValue_, &errorTrace_);
            throw PythonRaised{};
        }
        std::size_t taken = piece.size();
        if (written == Py_None) {
            // A non-blocking raw file that would block: the document cannot go on.
            Py_DECREF(written);
            PyErr_SetString(PyExc_BlockingIOError, "write() would block: the file object is non-blocking");
            PyErr_Fetch(&errorType_, &errorValue_, &errorTrace_);
            throw PythonRaised{};
        }
        if (PyLong_Check(written)) {
            const Py_ssize_t count = PyLong_AsSsize_t(written);
            if (count > 0 && static_cast<std::size_t>(count) < piece.size()) taken = static_cast<std::size_t>(count);
            if (count == 0) {
                Py_DECREF(written);
                PyErr_SetString(PyExc_OSError, "write() took none of the bytes it was given");
                PyErr_Fetch(&errorType_, &errorValue_, &errorTrace_);
                throw PythonRaised{};
            }
            PyErr_Clear();
        }
        Py_DECREF(written);
        piece.remove_prefix(taken);
    }
}

bool FileObjectSink::restoreError() {
    if (!errorType_) return false;
    PyErr_Restore(errorType_, errorValue_, errorTrace_);
    errorType_ = errorValue_ = errorTrace_ = nullptr;
    return true;
}

} // namespace dexmor::python
