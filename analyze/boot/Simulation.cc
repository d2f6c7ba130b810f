#include "boot/Simulation.h"

#include <algorithm>
#include <deque>
#include <functional>
#include <queue>
#include <stdexcept>
#include <tuple>
#include <utility>

#include "boot/FlowGraph.h"
#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "graph/Node.h"

namespace vantor::analyze {

namespace {

// Stands for a plugin or a barrier. What it does takes place on the virtual clock alone.
class SimulatedNode : public vantor::Node {
public:
    SimulatedNode(const std::string& nodeName, Microseconds length, std::size_t place)
        : vantor::Node(nodeName), run(length), entry(place) {}

    void Run() override {}
    std::string DotAttributes() const override { return ""; }

    const Microseconds run;
    const std::size_t entry;  // TimelineEntry::none for a barrier
};

// The nodes of a boot, linked as the boot program links them while it loads its plugins.
class SimulatedGraph {
public:
    SimulatedGraph(const BootTimeline& timeline, const std::vector<Microseconds>& runs) {
        for (const TimelineBarrier& barrier : timeline.barriers) {
            barriers.emplace_back(barrier.name, 0, TimelineEntry::none);
        }
        for (std::size_t entry = 0; entry < timeline.entries.size(); ++entry) {
            plugins.emplace_back(timeline.entries[entry].name, runs[entry], entry);
            Link(plugins.back(), timeline.entries[entry]);
        }
        for (const TimelineBystander& bystander : timeline.bystanders) {
            bystanders.emplace_back(bystander.name, 0, TimelineEntry::none);
            Link(bystanders.back(), bystander);
            bystanders.back().MarkDone();
        }
    }

    void Schedule(Executor& executor) {
        for (SimulatedNode& plugin : plugins) {
            plugin.Schedule(executor);
        }
    }

private:
    template <typename Lists>
    void Link(SimulatedNode& plugin, const Lists& lists) {
        for (const std::size_t barrier : lists.provided) {
            plugin.AddDependent(barriers[barrier]);
        }
        for (const std::size_t barrier : lists.required) {
            plugin.AddDependency(barriers[barrier]);
        }
    }

    // Barriers go first: a node that goes looks itself up in its neighbours' lists, and those of a
    // barrier can be long.
    std::deque<SimulatedNode> plugins;
    std::deque<SimulatedNode> bystanders;
    std::deque<SimulatedNode> barriers;
};

// A worker that is busy: until when, and with what. Of two that end at once the one that began
// first comes first.
struct BusyWorker {
    Microseconds until;
    std::size_t began;
    SimulatedNode* node;

    bool operator>(const BusyWorker& other) const {
        return std::tie(until, began) > std::tie(other.until, other.began);
    }
};

}  // namespace

double Prediction::Efficiency() const {
    return makespan == 0 ? 1.0
                         : static_cast<double>(work) /
                               (static_cast<double>(workers) * static_cast<double>(makespan));
}

Simulation::Simulation(const BootTimeline& measured) : timeline(measured) {
    runs.reserve(timeline.entries.size());
    for (const TimelineEntry& entry : timeline.entries) {
        runs.push_back(entry.Ran());
    }
}

void Simulation::SetRun(const std::string& name, Microseconds length) {
    bool found = false;
    for (std::size_t entry = 0; entry < runs.size(); ++entry) {
        if (timeline.entries[entry].name == name) {
            runs[entry] = length;
            found = true;
        }
    }
    if (!found) {
        throw std::runtime_error("no plugin '" + name + "' was run by this boot");
    }
}

bool Simulation::IsKnown(const std::string& name) const {
    const auto named = [&name](const auto& item) { return item.name == name; };
    return std::any_of(timeline.entries.begin(), timeline.entries.end(), named) ||
           std::any_of(timeline.barriers.begin(), timeline.barriers.end(), named);
}

void Simulation::DropEdge(const std::string& edge) {
    bool dropped = false;
    bool known = false;
    for (std::size_t colon = edge.find(':'); colon != std::string::npos;
         colon = edge.find(':', colon + 1)) {
        const std::string from = edge.substr(0, colon);
        const std::string to = edge.substr(colon + 1);
        dropped = DropEdge(from, to) || dropped;
        known = known || (IsKnown(from) && IsKnown(to));
    }
    if (!dropped) {
        throw std::runtime_error("no edge '" + edge + "': " +
                                 (known ? "no plugin provides or requires a barrier so"
                                        : "it takes the names of a plugin that was run and of a "
                                          "barrier, with a colon between them"));
    }
}

bool Simulation::DropEdge(const std::string& from, const std::string& to) {
    bool dropped = false;
    const auto drop = [&](std::vector<std::size_t>& list, const std::string& name) {
        const auto kept = std::remove_if(list.begin(), list.end(), [&](std::size_t barrier) {
            return timeline.barriers[barrier].name == name;
        });
        dropped = dropped || kept != list.end();
        list.erase(kept, list.end());
    };
    for (TimelineEntry& entry : timeline.entries) {
        if (entry.name == from) {
            drop(entry.provided, to);
        }
        if (entry.name == to) {
            drop(entry.required, from);
        }
    }
    return dropped;
}

Prediction Simulation::Predict(std::size_t workers) const {
    const FlowGraph flow(timeline);  // refuses a circle, on which the loop below would wait
    Prediction prediction;
    prediction.workers = workers;
    prediction.criticalPath = flow.LongestPath(runs);
    for (const Microseconds run : runs) {
        prediction.work += run;
    }
    const auto spread = static_cast<Microseconds>(workers);
    prediction.lowerBound =
        std::max(prediction.criticalPath, (prediction.work + spread - 1) / spread);
    prediction.starts.resize(runs.size());

    SimulatedGraph graph(timeline, runs);
    Executor executor(0, false);
    GlobalLockGuard guard;
    graph.Schedule(executor);
    std::priority_queue<BusyWorker, std::vector<BusyWorker>, std::greater<>> busy;
    std::size_t begun = 0;
    Microseconds now = 0;
    for (;;) {
        while (busy.size() < workers && executor.HasReady()) {
            auto& node = static_cast<SimulatedNode&>(executor.TakeNext());
            if (node.entry == TimelineEntry::none) {
                node.Execute(executor, guard);
                continue;
            }
            prediction.starts[node.entry] = now;
            busy.push({now + node.run, begun++, &node});
        }
        if (busy.empty()) {
            break;
        }
        now = busy.top().until;
        SimulatedNode& ended = *busy.top().node;
        busy.pop();
        ended.Execute(executor, guard);
    }
    prediction.makespan = now;
    return prediction;
}

}  // namespace vantor::analyze
