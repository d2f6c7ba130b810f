#ifndef VANTOR_GRAPH_TESTS_RANDOMGRAPH_H
#define VANTOR_GRAPH_TESTS_RANDOMGRAPH_H

#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace vantor::support {

// A graph without cycles as plain numbers, for the stress test: what is built from it is one thing,
// what is expected of it another.
struct RandomGraph {
    std::size_t nodes = 0;
    // {dependency, dependent}, in the order in which they are added; some stand there twice.
    std::vector<std::pair<std::size_t, std::size_t>> edges;
    std::vector<bool> markedDone;        // finished without running
    std::vector<std::size_t> requested;  // in order; some nodes are only reached through others
};

// The same graph for the same seed on every machine: up to `largest` nodes of one of several
// shapes, from independent nodes to a single chain.
RandomGraph MakeRandomGraph(std::uint32_t seed, std::size_t largest);

}  // namespace vantor::support

#endif
