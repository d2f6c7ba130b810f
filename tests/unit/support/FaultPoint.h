#ifndef VANTOR_SUPPORT_FAULTPOINT_H
#define VANTOR_SUPPORT_FAULTPOINT_H

#include <atomic>
#include <cerrno>
#include <functional>
#include <utility>

namespace vantor::support {

// One wrapped function of the C library: counts its calls and makes one of them fail, or all from
// one on, with an error of the test's choice. Its wrapper asks it once a call:
//
//   int __wrap_chmod(const char* path, mode_t mode) {
//       return chmodFault.Fails() ? -1 : __real_chmod(path, mode);
//   }
//
// Set it up while no other thread makes the call. Reset() in the fixture ends every plan.
class FaultPoint {
public:
    // The call number `call`, counted from 1 and from now on, fails with that error.
    void FailCall(int call, int error) { Plan(call, call, error); }
    // Every call from that number on fails.
    void FailFrom(int call, int error) { Plan(call, everyLaterCall, error); }

    // Run before each call, also before one that fails.
    void Before(std::function<void()> action) { before = std::move(action); }

    void Reset() {
        Plan(0, 0, 0);
        before = nullptr;
    }

    // Calls since the last plan or reset.
    int Calls() const { return calls; }

    // Counts a call. When it is to fail: true, with errno set.
    bool Fails() {
        const int call = ++calls;
        if (before) {
            before();
        }
        if (call < first || call > last) {
            return false;
        }
        errno = plannedError;
        return true;
    }

    int Error() const { return plannedError; }

private:
    static constexpr int everyLaterCall = 1000000000;

    void Plan(int firstCall, int lastCall, int error) {
        first = firstCall;
        last = lastCall;
        plannedError = error;
        calls = 0;
    }

    std::atomic<int> calls{0};
    int first = 0;
    int last = 0;
    int plannedError = 0;
    std::function<void()> before;
};

}  // namespace vantor::support

#endif
