#ifndef VANTOR_BENCH_GRAPHSHAPES_H
#define VANTOR_BENCH_GRAPHSHAPES_H

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace vantor::bench {

// Nodes 0 to count - 1, and edges from a node to one that waits for it, always a higher one.
struct GraphShape {
    std::size_t count = 0;
    std::vector<std::pair<std::size_t, std::size_t>> edges;
};

//   independent   no edges
//   layered       twenty nodes, a barrier that waits for them all, twenty that wait for it, ...
//   chain         each node waits for the one before it
// Throws std::invalid_argument for any other kind.
GraphShape MakeShape(const std::string& kind, std::size_t count);

// Runs the shape with empty bodies on a flow graph of oneTBB and returns the nanoseconds from the
// first message to the end of the last body. With `counted`, bodies count themselves: every node
// must have run once, or std::runtime_error is thrown.
double RunFlowGraph(const GraphShape& shape, int workers, bool counted);

// Prints what nodes cost in memory, a line for each kind; see MemoryBench.cc.
void PrintMemory(const std::string& kind, std::size_t count);

}  // namespace vantor::bench

#endif
