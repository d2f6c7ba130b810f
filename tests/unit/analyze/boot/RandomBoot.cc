#include "analyze/boot/RandomBoot.h"

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace vantor::support {

using analyze::BootTimeline;
using analyze::Microseconds;
using analyze::TimelineEntry;

namespace {

void AddOnce(std::vector<std::size_t>& list, std::size_t item) {
    if (std::find(list.begin(), list.end(), item) == list.end()) {
        list.push_back(item);
    }
}

// A boot as one array of nodes: plugins, then barriers.
class PlainBoot {
public:
    PlainBoot(const BootTimeline& boot, std::size_t count) : timeline(boot), workers(count) {
        const std::size_t plugins = timeline.entries.size();
        needs.resize(plugins + timeline.barriers.size());
        gives.resize(needs.size());
        for (std::size_t plugin = 0; plugin < plugins; ++plugin) {
            for (const std::size_t barrier : timeline.entries[plugin].provided) {
                gives[plugin].push_back(plugins + barrier);
                needs[plugins + barrier].push_back(plugin);
            }
            for (const std::size_t barrier : timeline.entries[plugin].required) {
                needs[plugin].push_back(plugins + barrier);
                gives[plugins + barrier].push_back(plugin);
            }
        }
        height.resize(needs.size());
        state.resize(needs.size());
    }

    Microseconds Makespan() {
        for (std::size_t plugin = 0; plugin < timeline.entries.size(); ++plugin) {
            Schedule(plugin);
        }
        Microseconds now = 0;
        std::vector<std::pair<Microseconds, std::size_t>> running;  // by their beginning
        for (;;) {
            while (running.size() < workers && !ready.empty()) {
                const std::size_t node = Take();
                if (node >= timeline.entries.size()) {
                    Finish(node);
                } else {
                    running.emplace_back(now + timeline.entries[node].Ran(), node);
                }
            }
            if (running.empty()) {
                return now;
            }
            const auto first = std::min_element(
                running.begin(), running.end(),
                [](const auto& left, const auto& right) { return left.first < right.first; });
            const auto [end, node] = *first;
            running.erase(first);
            now = end;
            Finish(node);
        }
    }

private:
    enum State { Idle, Waiting, Queued, Done };

    void Schedule(std::size_t node) {
        if (state[node] == Queued || state[node] == Done) {
            return;
        }
        state[node] = Waiting;
        bool isReady = true;
        for (const std::size_t need : needs[node]) {
            if (state[need] == Idle) {
                Schedule(need);
                isReady = false;
            }
            isReady = isReady && state[need] == Done;
        }
        if (isReady) {
            state[node] = Queued;
            ready.push_back(node);
        }
    }

    void Finish(std::size_t node) {
        state[node] = Done;
        for (const std::size_t dependent : gives[node]) {
            if (state[dependent] == Waiting) {
                Schedule(dependent);
            }
        }
    }

    int Height(std::size_t node) {
        if (height[node] == 0) {
            int above = 0;
            for (const std::size_t dependent : gives[node]) {
                above = std::max(above, Height(dependent));
            }
            height[node] = above + 1;
        }
        return height[node];
    }

    std::size_t Take() {
        const auto best = std::max_element(
            ready.begin(), ready.end(), [this](std::size_t left, std::size_t right) {
                return Height(left) < Height(right);  // the first of the highest
            });
        const std::size_t node = *best;
        ready.erase(best);
        return node;
    }

    const BootTimeline& timeline;
    std::size_t workers;
    std::vector<std::vector<std::size_t>> needs, gives;
    std::vector<int> height;
    std::vector<State> state;
    std::vector<std::size_t> ready;
};

}  // namespace

BootTimeline MakeRandomBoot(std::uint32_t seed, std::size_t plugins) {
    std::mt19937 draw(seed);
    const auto below = [&draw](std::size_t limit) {
        return static_cast<std::size_t>(draw()) % limit;
    };
    BootTimeline timeline;
    timeline.workers = 8;
    // Barriers stand between plugins of lower and of higher rank, so that there is no circle; ranks
    // are dealt out to the plugins in no order.
    const std::size_t barriers = plugins / 3 + 1;
    for (std::size_t barrier = 0; barrier < barriers; ++barrier) {
        timeline.barriers.emplace_back().name = "b" + std::to_string(barrier);
    }
    for (std::size_t plugin = 0; plugin < plugins; ++plugin) {
        TimelineEntry& entry = timeline.entries.emplace_back();
        entry.name = "p" + std::to_string(plugin);
        entry.end = static_cast<Microseconds>(below(4) == 0 ? 0 : below(1001));
        const std::size_t rank = below(barriers + 1);
        for (std::size_t edge = below(4); edge > 0 && rank > 0; --edge) {
            AddOnce(entry.required, below(2) == 0 ? rank - 1 : below(rank));
        }
        for (std::size_t edge = below(3); edge > 0 && rank < barriers; --edge) {
            AddOnce(entry.provided, below(2) == 0 ? rank : rank + below(barriers - rank));
        }
    }
    return timeline;
}

Microseconds PlainMakespan(const BootTimeline& timeline, std::size_t workers) {
    return PlainBoot(timeline, workers).Makespan();
}

}  // namespace vantor::support
