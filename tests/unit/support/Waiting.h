#ifndef VANTOR_SUPPORT_WAITING_H
#define VANTOR_SUPPORT_WAITING_H

#include <chrono>
#include <thread>

namespace vantor::support {

// Waits until the condition holds, at most a minute, which no healthy machine needs. Returns
// whether it came to hold.
template <typename Condition>
bool WaitUntil(Condition condition) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::minutes(1);
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::microseconds(50));
    }
    return true;
}

}  // namespace vantor::support

#endif
