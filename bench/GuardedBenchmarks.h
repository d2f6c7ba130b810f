#ifndef VANTOR_BENCH_GUARDEDBENCHMARKS_H
#define VANTOR_BENCH_GUARDEDBENCHMARKS_H

#include <benchmark/benchmark.h>

#include <functional>

namespace vantor::bench {

// Does what a benchmark measures. What it throws is reported as the error of the benchmark.
void Guarded(benchmark::State& state, const std::function<void()>& measure);

// Runs the registered benchmarks, or those that the command line chose. Returns the exit status of
// the program: EXIT_SUCCESS only if there was one to run and none reported an error.
int RunBenchmarks();

}  // namespace vantor::bench

#endif
