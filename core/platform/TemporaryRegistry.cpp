#include "platform/TemporaryRegistry.hpp"

#include <array>
#include <atomic>
#include <climits>
#include <csignal>
#include <cstring>
#include <ctime>
#include <mutex>

#include <unistd.h>

namespace OrvexKavorCore::temporaries {

namespace {

enum SlotState : int { kFree, kFilling, kEntered };

// As many temporaries as the tool has threads at most; a conversion beyond that
// simply is not cleaned up on a signal. The states are one small array and the
// paths another, which stays untouched (zero pages, not memory) but for the
// slots in use.
constexpr std::size_t kSlots = 1024;
constinit std::array<std::atomic<int>, kSlots> states{};
char paths[kSlots][PATH_MAX];

constexpr int kSignals[] = {SIGINT, SIGTERM, SIGHUP};

std::atomic<bool> ending{false};
std::atomic<int> namingSteps{0};

void removeAllAndDie(int signal) {
    ending.store(true);
    // Naming steps under way finish (each takes microseconds); one on this very
    // thread, interrupted by the signal, never does, hence the bound.
    for (int waited = 0; namingSteps.load() > 0 && waited < 1000; ++waited) {
        const timespec millisecond{0, 1000000};
        ::nanosleep(&millisecond, nullptr);
    }
    for (std::size_t i = 0; i < kSlots; ++i)
        if (states[i].load(std::memory_order_acquire) == kEntered) ::unlink(paths[i]);
    // The handler was installed to run once: the signal now takes its default
    // action, which ends the process with the status the parent expects.
    ::raise(signal);
}

} // namespace

int enter(std::string_view path) {
    if (path.size() >= PATH_MAX) return -1;
    for (std::size_t i = 0; i < kSlots; ++i) {
        int expected = kFree;
        if (!states[i].compare_exchange_strong(expected, kFilling, std::memory_order_acquire)) continue;
        std::memcpy(paths[i], path.data(), path.size());
        paths[i][path.size()] = '\0';
        states[i].store(kEntered, std::memory_order_release);
        return static_cast<int>(i);
    }
    return -1;
}

void leave(int slot) {
    if (slot >= 0) states[static_cast<std::size_t>(slot)].store(kFree, std::memory_order_release);
}

NamingWindow::NamingWindow() {
    namingSteps.fetch_add(1);
    ok_ = !ending.load();
}

NamingWindow::~NamingWindow() { namingSteps.fetch_sub(1); }

void removeOnSignals() {
    static std::once_flag installed;
    std::call_once(installed, [] {
        struct sigaction action {};
        action.sa_handler = removeAllAndDie;
        action.sa_flags = SA_RESETHAND | SA_NODEFER;
        sigemptyset(&action.sa_mask);
        for (int signal : kSignals) {
            struct sigaction previous {};
            // A signal the parent set to be ignored (nohup) stays ignored.
            if (::sigaction(signal, nullptr, &previous) == 0 && previous.sa_handler == SIG_IGN) continue;
            ::sigaction(signal, &action, nullptr);
        }
    });
}

} // namespace OrvexKavorCore::temporaries
