#include <tbb/flow_graph.h>
#include <tbb/global_control.h>
#include <tbb/task_arena.h>
#include <valgrind/callgrind.h>

#include <atomic>
#include <chrono>
#include <deque>
#include <stdexcept>
#include <vector>

#include "GraphShapes.h"

namespace vantor::bench {

namespace {

using Message = tbb::flow::continue_msg;
using FlowNode = tbb::flow::continue_node<Message>;

std::atomic<std::size_t> bodies{0};

template <typename Body>
double Run(const GraphShape& shape, const Body& body) {
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
    CALLGRIND_START_INSTRUMENTATION;
    const auto start = std::chrono::steady_clock::now();
    for (std::size_t i = 0; i < shape.count; ++i) {
        if (!waits[i]) {
            nodes[i].try_put(Message());
        }
    }
    graph.wait_for_all();
    const std::chrono::duration<double, std::nano> taken = std::chrono::steady_clock::now() - start;
    CALLGRIND_STOP_INSTRUMENTATION;
    return taken.count();
}

}  // namespace

double RunFlowGraph(const GraphShape& shape, int workers, bool counted) {
    const tbb::global_control limit(tbb::global_control::max_allowed_parallelism,
                                    static_cast<std::size_t>(workers));
    tbb::task_arena arena(workers);
    return arena.execute([&] {
        if (!counted) {
            return Run(shape, [](const Message& message) { return message; });
        }
        bodies = 0;
        const double taken = Run(shape, [](const Message& message) {
            ++bodies;
            return message;
        });
        if (bodies != shape.count) {
            throw std::runtime_error("the flow graph did not run every node once");
        }
        return taken;
    });
}

}  // namespace vantor::bench
