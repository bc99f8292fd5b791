#include "platform/Stack.hpp"

#include <cstdint>
#include <exception>
#include <new>
#include <system_error>

#include <pthread.h>

namespace OrvexKavorCore {

namespace {

// The lowest address of the calling thread's stack (stacks grow downwards on
// every platform this runs on), or 0 when the system does not say. It never
// changes for a thread, so each thread asks once: for the main thread the
// answer costs a read of the process's memory map.
std::uintptr_t stackLimit() {
    thread_local const std::uintptr_t limit = [] {
        pthread_attr_t attributes;
        if (::pthread_getattr_np(::pthread_self(), &attributes) != 0) return std::uintptr_t{0};
        void* low = nullptr;
        std::size_t size = 0;
        const bool known = ::pthread_attr_getstack(&attributes, &low, &size) == 0;
        ::pthread_attr_destroy(&attributes);
        return known ? reinterpret_cast<std::uintptr_t>(low) : std::uintptr_t{0};
    }();
    return limit;
}

std::size_t stackLeft() {
    const std::uintptr_t limit = stackLimit();
    const char here = 0;
    const auto address = reinterpret_cast<std::uintptr_t>(&here);
    return limit != 0 && address > limit ? address - limit : 0;
}

struct Task {
    const std::function<void()>* work;
    std::exception_ptr failure;
};

void* runTask(void* argument) {
    Task& task = *static_cast<Task*>(argument);
    try {
        (*task.work)();
    } catch (...) {
        task.failure = std::current_exception();
    }
    return nullptr;
}

} // namespace

void runWithStack(std::size_t needed, const std::function<void()>& work) {
    if (stackLeft() >= needed) return work();

    pthread_attr_t attributes;
    if (::pthread_attr_init(&attributes) != 0) throw std::bad_alloc();
    Task task{&work, nullptr};
    pthread_t thread;
    int error = ::pthread_attr_setstacksize(&attributes, needed);
    if (error == 0) error = ::pthread_create(&thread, &attributes, runTask, &task);
    ::pthread_attr_destroy(&attributes);
    if (error != 0) throw std::system_error(error, std::generic_category(), "cannot start a thread for a deep conversion");
    ::pthread_join(thread, nullptr);
    if (task.failure) std::rethrow_exception(task.failure);
}

} // namespace OrvexKavorCore
