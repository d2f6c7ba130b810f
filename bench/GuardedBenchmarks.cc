#include "GuardedBenchmarks.h"

#include <cstdlib>
#include <exception>
#include <iostream>

namespace vantor::bench {

namespace {

bool failed = false;

}  // namespace

void Guarded(benchmark::State& state, const std::function<void()>& measure) {
    try {
        measure();
    } catch (const std::exception& error) {
        failed = true;
        std::cerr << error.what() << std::endl;
        state.SkipWithError(error.what());
    }
}

int RunBenchmarks() {
    const bool any = benchmark::RunSpecifiedBenchmarks() != 0;
    return any && !failed ? EXIT_SUCCESS : EXIT_FAILURE;
}

}  // namespace vantor::bench
