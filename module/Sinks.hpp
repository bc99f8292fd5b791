#pragma once
// Where the module's conversions put their documents: a str built in place, a
// file that takes the place of a path, or a binary file object. The conversion
// runs with the interpreter lock released; each sink takes the lock only for the
// moments it needs Python (to grow the str, to call write()), and between pieces
// looks for a pending Ctrl-C.
#include <Python.h>

#include <dexmor/dexmor.hpp>

#include <chrono>
#include <filesystem>
#include <string>
#include <string_view>
#include <thread>

namespace dexmor::python {

// Thrown when a signal handler raised an exception during a call: the
// interpreter holds that exception already.
struct Interrupted {};

// Thrown when a Python call a sink made raised: the exception is kept by the
// sink (see FileObjectSink::restoreError) until the lock is held again.
struct PythonRaised {};

// Runs the pending signal handlers (Ctrl-C's KeyboardInterrupt) when asked
// between pieces, taking the interpreter lock only for that. Handlers run on the
// main thread only, so only a call made there looks, and at most ten times a
// second: the lock may have to wait for other threads.
class SignalWatch {
public:
    SignalWatch();
    // The thread state the lock was released from, while it is released.
    void lockReleasedBy(PyThreadState* state) { released_ = state; }
    // Throws Interrupted when a handler raised.
    void look();

private:
    std::thread::id thread_;
    PyThreadState* released_ = nullptr;
    std::chrono::steady_clock::time_point nextLook_;
};

// The document as a str, decoded piece by piece into the str's own storage: the
// str grows in place by a quarter at a time, so a document costs its characters
// once, not a UTF-8 copy and the str. A str's width (1, 2 or 4 bytes a
// character) follows its widest character, so it starts as ASCII and is made
// wider, once per width, when a wider character comes. Only what precedes the
// first NUL is kept, as the text of a file that passed through is its bytes up
// to the first NUL. Made and destroyed with the interpreter lock held.
class StrSink final : public OrvexKavorCore::DocumentSink {
public:
    explicit StrSink(SignalWatch& signals) : signals_(signals) {}
    ~StrSink() override { Py_XDECREF(str_); }
    StrSink(const StrSink&) = delete;
    StrSink& operator=(const StrSink&) = delete;

    // Throws std::runtime_error for text that is not UTF-8 (the conversion never
    // gives any), std::bad_alloc when the str cannot grow.
    void write(std::string_view piece) override;
    bool canTakeBack() const override { return true; }
    void takeBack() override;
    // The first room made is what the conversion expects (up to 64 Mi characters),
    // so a small document is not grown and copied again and again.
    void expect(std::size_t bytes) override;
    void checkpoint() override { signals_.look(); }

    // The str of everything written; nullptr with an exception set when it cannot
    // be made. Called once, with the lock held.
    PyObject* takeStr();

private:
    // Decodes whole characters of UTF-8 into the str.
    void append(std::string_view utf8);
    // Makes room for `more` characters (taking the lock).
    void reserve(std::size_t more);
    // Moves what is written into a str that holds characters up to `maxChar`
    // (taking the lock).
    void widen(Py_UCS4 maxChar);
    // Drops the str (taking the lock).
    void drop();

    SignalWatch& signals_;
    PyObject* str_ = nullptr;
    Py_UCS4 maxChar_ = 0x7F;   // what the str's width holds
    std::size_t length_ = 0;   // characters written
    std::size_t capacity_ = 0; // characters the str has room for
    char pending_[4] = {};     // a character whose bytes the next piece completes
    std::size_t pendingLength_ = 0;
    bool cut_ = false; // a NUL was seen: the rest is dropped
};

// The document written to a file that takes the place of `target` only when the
// caller commits it: a failed or refused conversion leaves the target as it was.
class PathSink final : public OrvexKavorCore::DocumentSink {
public:
    PathSink(std::filesystem::path target, SignalWatch& signals) : file_(std::move(target)), signals_(signals) {}
    void write(std::string_view piece) override { file_.write(piece); }
    bool canTakeBack() const override { return true; }
    void takeBack() override { file_.takeBack(); }
    void checkpoint() override { signals_.look(); }
    bool commit(std::string* error) { return file_.commit(error); }

private:
    OrvexKavorCore::AtomicFileSink file_;
    SignalWatch& signals_;
};

// The document handed to a binary file object's write(), piece by piece. A
// failed write() stops the conversion; its exception is raised by the call.
class FileObjectSink final : public OrvexKavorCore::DocumentSink {
public:
    // `write` is the object's bound write method (a borrowed reference).
    FileObjectSink(PyObject* write, SignalWatch& signals) : write_(write), signals_(signals) {}
    ~FileObjectSink() override;
    FileObjectSink(const FileObjectSink&) = delete;
    FileObjectSink& operator=(const FileObjectSink&) = delete;

    void write(std::string_view piece) override;
    void checkpoint() override { signals_.look(); }
    // With the lock held: sets the exception a write() raised again and returns
    // true, or returns false when none did.
    bool restoreError();

private:
    PyObject* write_;
    SignalWatch& signals_;
    PyObject* errorType_ = nullptr;
    PyObject* errorValue_ = nullptr;
    PyObject* errorTrace_ = nullptr;
};

} // namespace dexmor::python
