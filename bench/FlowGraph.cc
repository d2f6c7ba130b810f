#include "FlowGraph.h"

#include <tbb/flow_graph.h>

#include <atomic>
#include <deque>
#include <stdexcept>
#include <vector>

#include "MeasuredPart.h"

namespace vantor::bench {

namespace {

using Message = tbb::flow::continue_msg;
using FlowNode = tbb::flow::continue_node<Message>;

template <typename Body>
double RunWith(const GraphShape& shape, const Body& body) {
    tbb::flow::graph graph;
    std::deque<FlowNode> nodes;
    for (std::size_t i = 0; i < shape.count; ++i) {
        nodes.emplace_back(graph, body);
    }
    std::vector<bool> waits(shape.count);
    for (const auto& [from, to] : shape.edges) {
        tbb::flow::make_edge(nodes[from], nodes[to]);
        waits[to] = true;
    }
    return MeasuredSeconds([&] {
        for (std::size_t i = 0; i < shape.count; ++i) {
            if (!waits[i]) {
                nodes[i].try_put(Message());
            }
        }
        graph.wait_for_all();
    });
}

}  // namespace

FlowGraph::FlowGraph(int workers)
    : limit(tbb::global_control::max_allowed_parallelism, static_cast<std::size_t>(workers)),
      arena(workers) {}

double FlowGraph::Run(const GraphShape& shape) {
    return arena.execute(
        [&] { return RunWith(shape, [](const Message& message) { return message; }); });
}

double FlowGraph::RunCounted(const GraphShape& shape) {
    std::atomic<std::size_t> bodies{0};
    const double taken = arena.execute([&] {
        return RunWith(shape, [&bodies](const Message& message) {
            ++bodies;
            return message;
        });
    });
    if (bodies != shape.count) {
        throw std::runtime_error("the flow graph did not run every node once");
    }
    return taken;
}

}  // namespace vantor::bench
