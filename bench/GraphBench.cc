// What a graph of nodes that do nothing costs to run, as benchmarks of Google Benchmark's. PROGRAM
// is vantor, for its executor, or flow, for oneTBB's flow graph:
//
//     boot/PROGRAM/SHAPE/nodes:N/workers:W/...    one graph, by threads that have just begun
//     again/PROGRAM/SHAPE/nodes:N/workers:W/...   many graphs, one after the other; the median
//     check/PROGRAM/SHAPE/nodes:N/workers:W/...   one graph, whose nodes count themselves
//     life/SHAPE/nodes:N/workers:W/...            one graph of vantor's, and its executor's threads
//     schedule/near/nodes:N/...                   requesting a chain from its first node,
//     schedule/far/nodes:N/...                    or from its last one
//     height/nodes:N/...                          of the first node of a chain
//
// Each graph is built, and then the workers are started, outside of the time that is measured, but
// for a life, whose time they belong to. Before it begins they run a node each and wait for one
// another there, so that none sleeps yet. A boot or a life is to be all that its process measures:
//
//     bench-graph --benchmark_filter=^boot/vantor/chain/nodes:1000/workers:1/

#include <benchmark/benchmark.h>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <deque>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "FlowGraph.h"
#include "Gathering.h"
#include "GraphShapes.h"
#include "GuardedBenchmarks.h"
#include "MeasuredPart.h"
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

std::atomic<std::size_t> nodesRun{0};

class CountingNode : public EmptyNode {
public:
    void Run() override { ++nodesRun; }
};

class ArrivingNode : public EmptyNode {
public:
    explicit ArrivingNode(Gathering& place) : gathering(place) {}
    void Run() override { gathering.Arrive(); }

private:
    Gathering& gathering;
};

// The pointers to all of them, as the driver keeps its plugins.
template <typename Kind>
std::vector<Node*> SequenceOf(std::deque<Kind>& nodes) {
    std::vector<Node*> sequence;
    sequence.reserve(nodes.size());
    for (Node& node : nodes) {
        sequence.push_back(&node);
    }
    return sequence;
}

template <typename Kind>
std::deque<Kind> Build(const GraphShape& shape) {
    std::deque<Kind> nodes(shape.count);
    for (const auto& [from, to] : shape.edges) {
        nodes[to].AddDependency(nodes[from]);
    }
    return nodes;
}

// Vantor's side of the comparison; the other one is FlowGraph.
class OwnGraph {
public:
    explicit OwnGraph(int workerCount) : workers(workerCount) {}

    double Run(const GraphShape& shape) { return RunNodes<EmptyNode>(shape); }

    double RunCounted(const GraphShape& shape) {
        nodesRun = 0;
        const double taken = RunNodes<CountingNode>(shape);
        if (nodesRun != shape.count) {
            throw std::runtime_error("the executor did not run every node once");
        }
        return taken;
    }

private:
    // As the driver does it: no worker exists before the graph is complete. Then every node is
    // requested in order, and waited for.
    template <typename Kind>
    double RunNodes(const GraphShape& shape) {
        auto nodes = Build<Kind>(shape);
        const auto sequence = SequenceOf(nodes);
        if (!executor) {
            executor.emplace(workers, false);
        }
        Gather();
        return MeasuredSeconds([&] { Node::RunAll(sequence, *executor); });
    }

    void Gather() {
        Gathering gathering(workers);
        std::deque<ArrivingNode> nodes;
        for (int i = 0; i < workers; ++i) {
            nodes.emplace_back(gathering);
        }
        Node::RunAll(SequenceOf(nodes), *executor);
        gathering.RequireAll();
    }

    int workers;
    std::optional<Executor> executor;  // from the first run on
};

std::size_t NodeCount(const benchmark::State& state) {
    return static_cast<std::size_t>(state.range(0));
}

int WorkerCount(const benchmark::State& state) { return static_cast<int>(state.range(1)); }

// With `warm`, another graph runs first: caches and allocators are warm after it.
template <typename Graph>
void TimeGraphs(benchmark::State& state, const std::string& kind, bool warm) {
    const GraphShape shape = MakeShape(kind, NodeCount(state));
    Graph graph(WorkerCount(state));
    if (warm) {
        graph.Run(shape);
    }
    while (state.KeepRunning()) {
        state.SetIterationTime(graph.Run(shape));
    }
}

template <typename Graph>
void Check(benchmark::State& state, const std::string& kind) {
    const GraphShape shape = MakeShape(kind, NodeCount(state));
    Graph graph(WorkerCount(state));
    while (state.KeepRunning()) {
        state.SetIterationTime(graph.RunCounted(shape));
    }
}

void Live(benchmark::State& state, const std::string& kind) {
    auto nodes = Build<EmptyNode>(MakeShape(kind, NodeCount(state)));
    const auto sequence = SequenceOf(nodes);
    while (state.KeepRunning()) {
        state.SetIterationTime(MeasuredSeconds([&] {
            Executor executor(WorkerCount(state), false);
            Node::RunAll(sequence, executor);
        }));
    }
}

void Require(bool holds, const char* otherwise) {
    if (!holds) {
        throw std::runtime_error(otherwise);
    }
}

// Without workers, requesting is all that happens.
void ScheduleChain(benchmark::State& state, bool far) {
    auto nodes = Build<EmptyNode>(MakeShape("chain", NodeCount(state)));
    Executor executor(0, false);
    while (state.KeepRunning()) {
        state.SetIterationTime(MeasuredSeconds([&] {
            if (far) {
                nodes.back().Schedule(executor);
                return;
            }
            for (Node& node : nodes) {
                node.Schedule(executor);
            }
        }));
    }
    Require(nodes.front().State() == NodeState::Queued, "the chain's first node is not queued");
    Require(nodes.back().State() == NodeState::Waiting, "the chain's last node does not wait");
}

void ChainHeight(benchmark::State& state) {
    auto nodes = Build<EmptyNode>(MakeShape("chain", NodeCount(state)));
    std::int32_t height = 0;
    while (state.KeepRunning()) {
        state.SetIterationTime(MeasuredSeconds([&] { height = nodes.front().Height(); }));
    }
    Require(static_cast<std::size_t>(height) == nodes.size(), "wrong height");
}

constexpr std::int64_t smallest = 1000;
constexpr std::int64_t largest = 1000000;
constexpr int sizeStep = 10;

// Each is one graph: what is short needs many for a median that does not jump.
int Repetitions(std::int64_t count) {
    constexpr std::int64_t nodes = 100000;
    constexpr std::int64_t fewest = 3;
    return static_cast<int>(std::max(fewest, nodes / count)) | 1;  // odd: a median of what was seen
}

template <typename Measure, typename... Arguments>
auto* Register(const std::string& name, Measure* measure, const Arguments&... arguments) {
    const auto guarded = [=](benchmark::State& state) {
        Guarded(state, [&] { measure(state, arguments...); });
    };
    return benchmark::RegisterBenchmark(name.c_str(), guarded)->UseManualTime();
}

template <typename Graph>
void RegisterRuns(const std::string& program, const std::string& kind) {
    const std::string name = program + "/" + kind;
    for (const int workers : {1, 8}) {
        Register("check/" + name, &Check<Graph>, kind)
            ->ArgNames({"nodes", "workers"})
            ->Args({smallest, workers})
            ->Iterations(1);
        for (std::int64_t count = smallest; count <= largest; count *= sizeStep) {
            Register("boot/" + name, &TimeGraphs<Graph>, kind, false)
                ->ArgNames({"nodes", "workers"})
                ->Args({count, workers})
                ->Iterations(1);
            Register("again/" + name, &TimeGraphs<Graph>, kind, true)
                ->ArgNames({"nodes", "workers"})
                ->Args({count, workers})
                ->Iterations(1)
                ->Repetitions(Repetitions(count))
                ->ReportAggregatesOnly();
        }
    }
}

void RegisterAll() {
    for (const char* const kind : {"independent", "layered", "chain", "mixed"}) {
        RegisterRuns<OwnGraph>("vantor", kind);
        RegisterRuns<FlowGraph>("flow", kind);
    }
    for (const int workers : {1, 8}) {
        Register("life/chain", &Live, std::string("chain"))
            ->ArgNames({"nodes", "workers"})
            ->Args({smallest, workers})
            ->Iterations(1);
    }
    for (std::int64_t count = smallest; count <= largest; count *= sizeStep) {
        for (auto* const chain :
             {Register("schedule/near", &ScheduleChain, false),
              Register("schedule/far", &ScheduleChain, true), Register("height", &ChainHeight)}) {
            chain->ArgName("nodes")->Arg(count)->Iterations(1);
        }
    }
}

}  // namespace

}  // namespace vantor::bench

int main(int argc, char** argv) {
    using namespace vantor::bench;
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return EXIT_FAILURE;
    }
    RegisterAll();
    return RunBenchmarks();
}
