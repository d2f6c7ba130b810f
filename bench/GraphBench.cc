// What a graph of nodes that do nothing costs to run:
//
//     bench-graph boot vantor|flow SHAPE NODES WORKERS   vantor's executor, or oneTBB's flow graph
//     bench-graph again vantor|flow SHAPE NODES WORKERS  the same again and again; the median
//     bench-graph check vantor|flow SHAPE NODES WORKERS  once, and nodes count themselves
//     bench-graph schedule near|far NODES                requesting a chain from one of its ends
//     bench-graph height NODES                           of the first node of a chain
//     bench-graph memory KIND NODES                      resident bytes; see MemoryBench.cc
//
// Prints "nanoseconds <n>" for the part that is measured: the graph is built before it, and the
// workers are started before it.

#include <unistd.h>
#include <valgrind/callgrind.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <deque>
#include <exception>
#include <iostream>
#include <stdexcept>
#include <string>
#include <vector>

#include "GraphShapes.h"
#include "graph/Executor.h"
#include "graph/Node.h"

namespace vantor::bench {

namespace {

class EmptyNode : public Node {
public:
    EmptyNode() : Node("node") {}
    void Run() override {}
    std::string DotAttributes() const override { return {}; }
};

std::atomic<std::size_t> runs{0};

class CountingNode : public EmptyNode {
public:
    void Run() override { ++runs; }
};

template <typename Kind>
std::deque<Kind> Build(const GraphShape& shape) {
    std::deque<Kind> nodes(shape.count);
    for (const auto& [from, to] : shape.edges) {
        nodes[to].AddDependency(nodes[from]);
    }
    return nodes;
}

template <typename Work>
double Nanoseconds(const Work& work) {
    CALLGRIND_START_INSTRUMENTATION;  // nothing at all outside of callgrind
    const auto start = std::chrono::steady_clock::now();
    work();
    const std::chrono::duration<double, std::nano> taken = std::chrono::steady_clock::now() - start;
    CALLGRIND_STOP_INSTRUMENTATION;
    return taken.count();
}

[[noreturn]] void Report(double nanoseconds) {
    std::cout << "nanoseconds " << std::fixed << nanoseconds << std::endl;
    _exit(EXIT_SUCCESS);  // a million nodes take long to destroy, and nobody measures that
}

// As the driver does it: the executor is there first, then every node is requested in order.
template <typename Kind>
double RunVantor(const GraphShape& shape, Executor& executor) {
    auto& nodes = *new std::deque<Kind>(Build<Kind>(shape));
    std::vector<Node*> sequence;
    sequence.reserve(nodes.size());
    for (Node& node : nodes) {
        sequence.push_back(&node);
    }
    return Nanoseconds([&] { Node::RunAll(sequence, executor); });
}

// Once, as in a boot; or so often that caches are warm, each time with a graph of its own and all
// with the same threads.
void MeasureRuns(const std::vector<std::string>& words) {
    constexpr std::size_t enough = 100000;
    const GraphShape shape = MakeShape(words.at(2), std::stoul(words.at(3)));
    const int workers = std::stoi(words.at(4));
    const std::size_t runCount = words.at(0) == "boot" ? 1 : 1 + enough / shape.count;
    std::vector<double> taken(runCount);
    const bool isVantor = words.at(1) == "vantor";
    Executor executor(isVantor ? workers : 0, false);
    for (double& one : taken) {
        one =
            isVantor ? RunVantor<EmptyNode>(shape, executor) : RunFlowGraph(shape, workers, false);
    }
    std::sort(taken.begin(), taken.end());
    Report(taken[taken.size() / 2]);
}

void CheckRun(const std::vector<std::string>& words) {
    const GraphShape shape = MakeShape(words.at(2), std::stoul(words.at(3)));
    const int workers = std::stoi(words.at(4));
    if (words.at(1) == "flow") {
        Report(RunFlowGraph(shape, workers, true));
    }
    Executor executor(workers, false);
    const double taken = RunVantor<CountingNode>(shape, executor);
    if (runs != shape.count) {
        throw std::runtime_error("the executor did not run every node once");
    }
    Report(taken);
}

// Without workers, requesting is all that happens.
void MeasureSchedule(const std::string& end, std::size_t count) {
    auto& nodes = *new std::deque<EmptyNode>(Build<EmptyNode>(MakeShape("chain", count)));
    Executor executor(0, false);
    const double taken = Nanoseconds([&] {
        if (end == "far") {
            nodes.back().Schedule(executor);
            return;
        }
        for (Node& node : nodes) {
            node.Schedule(executor);
        }
    });
    if (nodes.front().State() != NodeState::Queued || nodes.back().State() != NodeState::Waiting) {
        throw std::runtime_error("the chain was not requested");
    }
    Report(taken);
}

void MeasureHeight(std::size_t count) {
    auto& nodes = *new std::deque<EmptyNode>(Build<EmptyNode>(MakeShape("chain", count)));
    std::int32_t height = 0;
    const double taken = Nanoseconds([&] { height = nodes.front().Height(); });
    if (static_cast<std::size_t>(height) != count) {
        throw std::runtime_error("wrong height");
    }
    Report(taken);
}

void Measure(const std::vector<std::string>& words) {
    const std::string& mode = words.at(0);
    if (mode == "boot" || mode == "again") {
        MeasureRuns(words);
    } else if (mode == "check") {
        CheckRun(words);
    } else if (mode == "schedule") {
        MeasureSchedule(words.at(1), std::stoul(words.at(2)));
    } else if (mode == "height") {
        MeasureHeight(std::stoul(words.at(1)));
    } else if (mode == "memory") {
        PrintMemory(words.at(1), std::stoul(words.at(2)));
    } else {
        throw std::invalid_argument("no such mode: " + mode);
    }
}

}  // namespace

}  // namespace vantor::bench

int main(int argc, char** argv) {
    try {
        vantor::bench::Measure({argv + 1, argv + argc});
    } catch (const std::exception& error) {
        std::cerr << "bench-graph: " << error.what() << std::endl;
        _exit(EXIT_FAILURE);
    }
    _exit(EXIT_SUCCESS);
}
