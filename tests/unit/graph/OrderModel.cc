#include "graph/OrderModel.h"

#include <algorithm>
#include <set>

namespace vantor::support {

OrderModel::OrderModel(const RandomGraph& randomGraph)
    : graph(randomGraph),
      dependencies(graph.nodes),
      dependents(graph.nodes),
      heights(graph.nodes, 1),
      run(graph.nodes, false) {
    for (const auto& [dependency, dependent] : graph.edges) {
        dependencies[dependent].push_back(dependency);
        dependents[dependency].push_back(dependent);
    }
    FindHeights();
    FindRun();
}

// Peels the graph from its end: a node's height is final once every dependent has been peeled.
void OrderModel::FindHeights() {
    std::vector<std::size_t> unpeeled(graph.nodes);
    std::vector<std::size_t> peelable;
    for (std::size_t node = 0; node < graph.nodes; ++node) {
        unpeeled[node] = dependents[node].size();
        if (unpeeled[node] == 0) {
            peelable.push_back(node);
        }
    }
    while (!peelable.empty()) {
        const std::size_t node = peelable.back();
        peelable.pop_back();
        for (const std::size_t dependency : dependencies[node]) {
            heights[dependency] = std::max(heights[dependency], heights[node] + 1);
            if (--unpeeled[dependency] == 0) {
                peelable.push_back(dependency);
            }
        }
    }
}

// Walks upwards from the requested nodes, the first dependency first, on a stack of its own.
void OrderModel::FindRun() {
    std::vector<std::size_t> stack(graph.requested.rbegin(), graph.requested.rend());
    while (!stack.empty()) {
        const std::size_t node = stack.back();
        stack.pop_back();
        if (run[node] || graph.markedDone[node]) {
            continue;
        }
        run[node] = true;
        bool ready = true;
        for (auto it = dependencies[node].rbegin(); it != dependencies[node].rend(); ++it) {
            if (!graph.markedDone[*it]) {
                ready = false;
                stack.push_back(*it);
            }
        }
        if (ready) {
            firstReady.push_back(node);
        }
    }
}

// One serial run, node by node.
class OrderModel::Replay {
public:
    explicit Replay(const OrderModel& orderModel)
        : model(orderModel), ready(model.firstReady), unmet(model.graph.nodes) {
        for (std::size_t node = 0; node < model.graph.nodes; ++node) {
            for (const std::size_t dependency : model.dependencies[node]) {
                if (!model.graph.markedDone[dependency]) {
                    unmet[node].insert(dependency);
                }
            }
        }
    }

    bool IsOver() const { return ready.empty(); }

    // The highest of the ready ones, oldest first.
    std::vector<std::size_t> Highest() const {
        std::size_t height = 0;
        for (const std::size_t node : ready) {
            height = std::max(height, model.heights[node]);
        }
        std::vector<std::size_t> highest;
        std::copy_if(ready.begin(), ready.end(), std::back_inserter(highest),
                     [&](std::size_t node) { return model.heights[node] == height; });
        return highest;
    }

    void Run(std::size_t node) {
        ready.erase(std::find(ready.begin(), ready.end(), node));
        for (const std::size_t dependent : model.dependents[node]) {
            if (unmet[dependent].erase(node) == 1 && unmet[dependent].empty() &&
                model.run[dependent]) {
                ready.push_back(dependent);
            }
        }
    }

private:
    const OrderModel& model;
    std::vector<std::size_t> ready;
    std::vector<std::set<std::size_t>> unmet;
};

std::vector<std::size_t> OrderModel::SerialOrder(const Choice& choice) const {
    std::vector<std::size_t> order;
    for (Replay replay(*this); !replay.IsOver(); replay.Run(order.back())) {
        const std::vector<std::size_t> highest = replay.Highest();
        order.push_back(highest.at(choice(highest.size())));
    }
    return order;
}

bool OrderModel::IsSerialOrder(const std::vector<std::size_t>& order) const {
    Replay replay(*this);
    for (const std::size_t node : order) {
        const std::vector<std::size_t> highest = replay.Highest();
        if (std::find(highest.begin(), highest.end(), node) == highest.end()) {
            return false;
        }
        replay.Run(node);
    }
    return replay.IsOver();
}

}  // namespace vantor::support
