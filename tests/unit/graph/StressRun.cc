#include "graph/StressRun.h"

#include "graph/GlobalLock.h"

namespace vantor::support {

class StressRun::StressNode : public Node {
public:
    StressNode(StressRun& stressRun, std::size_t nodeNumber)
        : Node(std::to_string(nodeNumber)), stress(stressRun), number(nodeNumber) {}

    void Run() override {
        for (const StressNode* earlier : before) {
            tooEarly += earlier->finished ? 0 : 1;
        }
        ++runs;
        if (stress.serial) {
            stress.order.push_back(number);
        }
        finished = true;
    }

    std::string DotAttributes() const override { return ""; }

    std::vector<const StressNode*> before;
    bool finished = false;
    int runs = 0;
    int tooEarly = 0;

private:
    StressRun& stress;
    std::size_t number;
};

StressRun::StressRun(const RandomGraph& randomGraph) : graph(randomGraph) {
    for (std::size_t number = 0; number < graph.nodes; ++number) {
        nodes.emplace_back(*this, number);
    }
    bool downwards = false;
    for (const auto& [dependency, dependent] : graph.edges) {
        if (downwards) {
            nodes[dependency].AddDependent(nodes[dependent]);
        } else {
            nodes[dependent].AddDependency(nodes[dependency]);
        }
        downwards = !downwards;
        nodes[dependent].before.push_back(&nodes[dependency]);
    }
    for (std::size_t number = 0; number < graph.nodes; ++number) {
        if (graph.markedDone[number]) {
            nodes[number].MarkDone();
            nodes[number].finished = true;
        }
    }
}

StressRun::~StressRun() = default;

void StressRun::Request(Executor& executor) {
    for (const std::size_t number : graph.requested) {
        nodes[number].Schedule(executor);
    }
}

void StressRun::Run(std::int32_t workers, bool randomize, Requests requests) {
    serial = workers == 1;
    Executor executor(workers, randomize);
    if (requests == Requests::BeforeTheWorkersBegin) {
        const GlobalLockGuard guard;
        Request(executor);
    } else {
        Request(executor);
    }
    for (const std::size_t number : graph.requested) {
        nodes[number].WaitDone();
    }
}

int StressRun::Runs(std::size_t node) const { return nodes[node].runs; }

int StressRun::TooEarly() const {
    int count = 0;
    for (const StressNode& node : nodes) {
        count += node.tooEarly;
    }
    return count;
}

}  // namespace vantor::support
