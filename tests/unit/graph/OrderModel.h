#ifndef VANTOR_GRAPH_TESTS_ORDERMODEL_H
#define VANTOR_GRAPH_TESTS_ORDERMODEL_H

#include <cstddef>
#include <functional>
#include <vector>

#include "graph/RandomGraph.h"

namespace vantor::support {

// What the run of a graph must look like, worked out from its numbers alone and by other means than
// the product's: who is run at all, and in which order one worker does so when everything is
// requested before it begins. "Highest first, oldest first."
class OrderModel {
public:
    explicit OrderModel(const RandomGraph& randomGraph);

    // Of the `count` highest that are ready, oldest first, the position of the one to run.
    using Choice = std::function<std::size_t(std::size_t count)>;

    std::vector<std::size_t> SerialOrder(const Choice& choice) const;

    // Whether each node of the order was, at its turn, ready and among the highest, and nobody is
    // left out.
    bool IsSerialOrder(const std::vector<std::size_t>& order) const;

    // Whether the node is run: requested, or needed by one that is.
    bool IsRun(std::size_t node) const { return run[node]; }

    const std::vector<std::size_t>& Heights() const { return heights; }

private:
    class Replay;

    void FindHeights();
    void FindRun();

    const RandomGraph& graph;
    std::vector<std::vector<std::size_t>> dependencies;
    std::vector<std::vector<std::size_t>> dependents;
    std::vector<std::size_t> heights;
    std::vector<bool> run;
    std::vector<std::size_t> firstReady;  // ready before anything has run, oldest first
};

}  // namespace vantor::support

#endif
