#pragma once
// The names of temporary files that a signal handler may remove: a fixed table,
// so that the handler neither allocates nor follows a pointer a thread may free.
#include <string_view>

namespace OrvexKavorCore::temporaries {

// Enters a path; returns its slot, or -1 when the table is full or the path too long.
int enter(std::string_view path);
// Takes the path of `slot` out again (-1: nothing).
void leave(int slot);
// Brackets the steps that give a temporary a name and take it away again (enter,
// create or link, rename, leave), so that a handler never removes the entered
// names while such a step may still add one: it waits for the steps under way,
// and refuses new ones (ok() is then false and the step must not be taken).
class NamingWindow {
public:
    NamingWindow();
    ~NamingWindow();
    NamingWindow(const NamingWindow&) = delete;
    NamingWindow& operator=(const NamingWindow&) = delete;
    bool ok() const { return ok_; }

private:
    bool ok_;
};

// Installs, once, handlers for SIGINT, SIGTERM and SIGHUP that remove every entered
// path and then let the signal end the process.
void removeOnSignals();

} // namespace OrvexKavorCore::temporaries
