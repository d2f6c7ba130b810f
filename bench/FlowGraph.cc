#include "FlowGraph.h"

#include <tbb/flow_graph.h>

#include <atomic>
#include <deque>
#include <stdexcept>
#include <vector>

#include "Gathering.h"
#include "MeasuredPart.h"

namespace vantor::bench {

namespace {

using Message = tbb::flow::continue_msg;
using FlowNode = tbb::flow::continue_node<Message>;

// oneTBB starts a thread when there is first something for it to do: here, to wait for the others.
void Gather(int workers) {
    Gathering gathering(workers);
    tbb::flow::graph graph;
    std::deque<FlowNode> nodes;
    for (int i = 0; i < workers; ++i) {
        nodes.emplace_back(graph, [&gathering](const Message& message) {
            gathering.Arrive();
            return message;
        });
    }
    for (FlowNode& node : nodes) {
        node.try_put(Message());
    }
    graph.wait_for_all();
    gathering.RequireAll();
}

template <typename Body>
double RunWith(const GraphShape& shape, int workers, const Body& body) {
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
    std::vector<FlowNode*> first;
    for (std::size_t i = 0; i < shape.count; ++i) {
        if (!waits[i]) {
            first.push_back(&nodes[i]);
        }
    }
    Gather(workers);
    return MeasuredSeconds([&] {
        for (FlowNode* node : first) {
            node->try_put(Message());
        }
        graph.wait_for_all();
    });
}

}  // namespace

FlowGraph::FlowGraph(int workerCount)
    : workers(workerCount),
      limit(tbb::global_control::max_allowed_parallelism, static_cast<std::size_t>(workerCount)),
      arena(workerCount) {}

double FlowGraph::Run(const GraphShape& shape) {
    return arena.execute(
        [&] { return RunWith(shape, workers, [](const Message& message) { return message; }); });
}

double FlowGraph::RunCounted(const GraphShape& shape) {
    std::atomic<std::size_t> bodies{0};
    const double taken = arena.execute([&] {
        return RunWith(shape, workers, [&bodies](const Message& message) {
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
