#ifndef VANTOR_GRAPH_TESTS_STRESSRUN_H
#define VANTOR_GRAPH_TESTS_STRESSRUN_H

#include <cstddef>
#include <cstdint>
#include <deque>
#include <vector>

#include "graph/Executor.h"
#include "graph/Node.h"
#include "graph/RandomGraph.h"

namespace vantor::support {

// When the nodes of a stressed graph are requested.
enum class Requests {
    BeforeTheWorkersBegin,  // all of them, with the lock held: one worker's order is certain
    WhileTheyWork,          // as the driver does it
};

// A random graph of nodes of the product, run once. The nodes keep plain numbers, written by one
// worker and read by those that come after it in the graph, and by the test after WaitDone(): it is
// the product's lock that must order all of it, as the thread sanitizer sees.
class StressRun {
public:
    explicit StressRun(const RandomGraph& randomGraph);
    ~StressRun();
    StressRun(const StressRun&) = delete;
    StressRun& operator=(const StressRun&) = delete;

    // Requests, waits for the requested ones and stops the workers. Once only.
    void Run(std::int32_t workers, bool randomize, Requests requests);

    // The nodes in the order in which they were run; for one worker only.
    const std::vector<std::size_t>& Order() const { return order; }

    int Runs(std::size_t node) const;

    // How often a node was run before one of its dependencies was done.
    int TooEarly() const;

private:
    class StressNode;

    void Request(Executor& executor);

    const RandomGraph& graph;
    bool serial = false;
    std::vector<std::size_t> order;
    std::deque<StressNode> nodes;
};

}  // namespace vantor::support

#endif
