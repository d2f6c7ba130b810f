#include "boot/Comparison.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <tuple>
#include <utility>

namespace vantor::analyze {

namespace {

Microseconds Median(const std::vector<Microseconds>& sorted) {
    const std::size_t middle = sorted.size() / 2;
    return sorted.size() % 2 == 1 ? sorted[middle]
                                  : sorted[middle - 1] + (sorted[middle] - sorted[middle - 1]) / 2;
}

Microseconds Length(Microseconds start, Microseconds end) { return end > start ? end - start : 0; }

// What a side's logs say of one plugin.
struct SideOfPlugin {
    bool isListed = false;
    std::vector<Microseconds> runs;
};

struct BothSides {
    SideOfPlugin before;
    SideOfPlugin after;
};

using Plugins = std::map<std::string, BothSides>;

void Collect(const std::vector<BootLog>& boots, SideOfPlugin BothSides::*side, Plugins& plugins) {
    for (const BootLog& boot : boots) {
        std::map<std::string, std::size_t> seen;
        for (const LogEntry& entry : boot.entries) {
            const std::size_t count = ++seen[entry.name];
            SideOfPlugin& plugin =
                plugins[count == 1 ? entry.name : entry.name + " (" + std::to_string(count) + ")"].*
                side;
            plugin.isListed = true;
            if (entry.WasRun()) {
                plugin.runs.push_back(Length(entry.start, entry.end));
            }
        }
    }
}

std::vector<Microseconds> Totals(const std::vector<BootLog>& boots) {
    std::vector<Microseconds> totals;
    totals.reserve(boots.size());
    for (const BootLog& boot : boots) {
        totals.push_back(Length(boot.start, boot.end));
    }
    return totals;
}

void SortByGreatest(std::vector<PluginChange>& changes) {
    std::stable_sort(changes.begin(), changes.end(),
                     [](const PluginChange& left, const PluginChange& right) {
                         return std::abs(left.run.Difference()) > std::abs(right.run.Difference());
                     });
}

void AddPlugin(const std::string& name, const BothSides& sides, const NoiseRule& rule,
               Comparison& comparison) {
    const bool ranBefore = !sides.before.runs.empty();
    const bool ranAfter = !sides.after.runs.empty();
    if (ranBefore && ranAfter) {
        const Change run = CompareValues(sides.before.runs, sides.after.runs, rule);
        if (run.IsSlower()) {
            comparison.slower.push_back({name, run});
        } else if (run.IsFaster()) {
            comparison.faster.push_back({name, run});
        } else {
            ++comparison.unchanged;
        }
    } else if (ranAfter) {
        (sides.before.isListed ? comparison.nowRun : comparison.added).push_back(name);
    } else if (ranBefore) {
        (sides.after.isListed ? comparison.noLongerRun : comparison.removed).push_back(name);
    } else if (sides.before.isListed != sides.after.isListed) {
        (sides.after.isListed ? comparison.added : comparison.removed).push_back(name);
    }
}

}  // namespace

double Change::Growth() const {
    if (before == 0) {
        return after == 0 ? 0.0 : std::numeric_limits<double>::infinity();
    }
    return static_cast<double>(Difference()) / static_cast<double>(before);
}

Change CompareValues(std::vector<Microseconds> before, std::vector<Microseconds> after,
                     const NoiseRule& rule) {
    std::sort(before.begin(), before.end());
    std::sort(after.begin(), after.end());
    Change change;
    change.before = Median(before);
    change.after = Median(after);
    change.beforeSpread = before.back() - before.front();
    change.afterSpread = after.back() - after.front();
    change.noise = std::max({rule.least, change.beforeSpread, change.afterSpread});
    if (before.size() == 1 || after.size() == 1) {
        const double margin = rule.margin * static_cast<double>(change.before);
        if (margin > static_cast<double>(change.noise)) {
            change.noise = static_cast<Microseconds>(margin);
        }
    }
    return change;
}

Comparison CompareBoots(const std::vector<BootLog>& before, const std::vector<BootLog>& after,
                        const NoiseRule& rule) {
    Plugins plugins;
    Collect(before, &BothSides::before, plugins);
    Collect(after, &BothSides::after, plugins);
    Comparison comparison;
    comparison.boots[0] = before.size();
    comparison.boots[1] = after.size();
    comparison.total = CompareValues(Totals(before), Totals(after), rule);
    for (const auto& [name, sides] : plugins) {
        AddPlugin(name, sides, rule, comparison);
    }
    SortByGreatest(comparison.slower);
    SortByGreatest(comparison.faster);
    return comparison;
}

std::size_t MedianBoot(const std::vector<BootLog>& boots) {
    const std::vector<Microseconds> totals = Totals(boots);
    std::vector<std::pair<Microseconds, std::size_t>> sorted;
    for (std::size_t boot = 0; boot < totals.size(); ++boot) {
        sorted.emplace_back(totals[boot], boot);
    }
    std::sort(sorted.begin(), sorted.end());
    return sorted[(sorted.size() - 1) / 2].second;
}

}  // namespace vantor::analyze
