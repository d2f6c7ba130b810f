#ifndef VANTOR_BENCH_FLOWGRAPH_H
#define VANTOR_BENCH_FLOWGRAPH_H

#include <tbb/global_control.h>
#include <tbb/task_arena.h>

#include "GraphShapes.h"

namespace vantor::bench {

// Runs shapes on flow graphs of oneTBB, beside which vantor's executor stands. The threads are
// there and awake before each run, as the executor's are, and stay from run to run. Only one object
// at a time.
class FlowGraph {
public:
    // The thread that calls Run() is one of the workers, so that one worker is that thread alone.
    explicit FlowGraph(int workerCount);

    // Runs a new graph of the shape, with empty bodies, and returns the seconds from the first
    // message to the end of the last body. Throws std::runtime_error when oneTBB does not start its
    // threads.
    double Run(const GraphShape& shape);

    // The same with bodies that count themselves. Throws std::runtime_error unless every node ran
    // once.
    double RunCounted(const GraphShape& shape);

private:
    int workers;
    tbb::global_control limit;
    tbb::task_arena arena;
};

}  // namespace vantor::bench

#endif
