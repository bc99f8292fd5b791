#pragma once
// Running deeply recursive work where the stack can hold it.
#include <cstddef>
#include <functional>

namespace OrvexKavorCore {

// Runs `work` on the calling thread when at least `needed` bytes of its stack are
// left, else on a thread of its own with a stack that size, waiting for it. An
// exception `work` throws is thrown again on the calling thread.
void runWithStack(std::size_t needed, const std::function<void()>& work);

} // namespace OrvexKavorCore
