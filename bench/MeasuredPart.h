#ifndef VANTOR_BENCH_MEASUREDPART_H
#define VANTOR_BENCH_MEASUREDPART_H

#include <valgrind/callgrind.h>

#include <chrono>

namespace vantor::bench {

// Does the work that is to be measured and returns the seconds that it took. Under callgrind with
// --instr-atstart=no, what is counted is the instructions of such work and nothing else.
template <typename Work>
double MeasuredSeconds(const Work& work) {
    CALLGRIND_START_INSTRUMENTATION;  // nothing at all outside of callgrind
    const auto start = std::chrono::steady_clock::now();
    work();
    const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - start;
    CALLGRIND_STOP_INSTRUMENTATION;
    return taken.count();
}

}  // namespace vantor::bench

#endif
