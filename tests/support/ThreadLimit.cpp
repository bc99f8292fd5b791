// A stand-in for pthread_create that gives a process only the number of threads
// DEXMOR_TEST_THREADS names and refuses the rest with EAGAIN, as a system out of
// threads does. Loaded with LD_PRELOAD by the tests of `dexmor xml -j`.
#include <dlfcn.h>
#include <pthread.h>

#include <atomic>
#include <cerrno>
#include <cstdlib>

namespace {

using Create = int (*)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);

std::atomic<long> given{0};

} // namespace

extern "C" int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*start)(void*),
                              void* argument) {
    if (const char* allowed = std::getenv("DEXMOR_TEST_THREADS"); allowed && given++ >= std::atol(allowed))
        return EAGAIN;
    static const auto real = reinterpret_cast<Create>(dlsym(RTLD_NEXT, "pthread_create"));
    return real ? real(thread, attributes, start, argument) : EAGAIN;
}
