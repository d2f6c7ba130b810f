#ifndef VANTOR_BENCH_GATHERING_H
#define VANTOR_BENCH_GATHERING_H

#include <atomic>
#include <chrono>
#include <stdexcept>
#include <thread>

namespace vantor::bench {

// Where threads wait for one another, so that all of them have begun and none sleeps yet when what
// is measured begins. Each arrives from a node of its own.
class Gathering {
public:
    explicit Gathering(int threadCount) : expected(threadCount) {}

    // Returns when all have arrived, or after ten seconds; gives way to other threads meanwhile.
    void Arrive() {
        for (++arrived; arrived < expected && Clock::now() < end;) {
            std::this_thread::yield();
        }
        if (arrived < expected) {
            late = true;
        }
    }

    // To be called after the last arrival. Throws std::runtime_error when one waited in vain.
    void RequireAll() const {
        if (late) {
            throw std::runtime_error("not all threads of the measured program have begun");
        }
    }

private:
    using Clock = std::chrono::steady_clock;

    const int expected;
    const Clock::time_point end = Clock::now() + std::chrono::seconds(10);
    std::atomic<int> arrived{0};
    std::atomic<bool> late{false};
};

}  // namespace vantor::bench

#endif
