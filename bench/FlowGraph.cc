#include "FlowGraph.h"

#include <tbb/flow_graph.h>
#include <tbb/task_group.h>

#include <atomic>
#include <chrono>
#include <deque>
#include <stdexcept>
#include <thread>
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
    std::vector<FlowNode*> first;
    for (std::size_t i = 0; i < shape.count; ++i) {
        if (!waits[i]) {
            first.push_back(&nodes[i]);
        }
    }
    return MeasuredSeconds([&] {
        for (FlowNode* node : first) {
            node->try_put(Message());
        }
        graph.wait_for_all();
    });
}

// oneTBB starts a thread when there is first something for it to do: here, to wait for the others.
void StartThreads(tbb::task_arena& arena, int workers) {
    using Clock = std::chrono::steady_clock;
    const auto end = Clock::now() + std::chrono::seconds(10);
    std::atomic<int> present{0};
    arena.execute([&] {
        tbb::task_group threads;
        for (int i = 0; i < workers; ++i) {
            threads.run([&] {
                for (++present; present < workers && Clock::now() < end;) {
                    std::this_thread::yield();
                }
            });
        }
        threads.wait();
    });
    if (Clock::now() >= end) {
        throw std::runtime_error("oneTBB did not start all its threads");
    }
}

}  // namespace

FlowGraph::FlowGraph(int workers)
    : limit(tbb::global_control::max_allowed_parallelism, static_cast<std::size_t>(workers)),
      arena(workers) {
    StartThreads(arena, workers);
}

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
