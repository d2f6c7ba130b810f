#include "boot/BootTimeline.h"

#include <algorithm>
#include <map>
#include <string_view>
#include <utility>

#include "boot/Remarks.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t none = TimelineEntry::none;

// Puts the timeline together, one step a method, in the order of Make().
class TimelineMaker {
public:
    TimelineMaker(const BootLog& bootLog, const BootModel& bootModel)
        : log(bootLog), model(bootModel), pluginOf(bootLog.entries.size(), none) {}

    BootTimeline Make() {
        timeline.workers = log.parallel ? 8 : 1;
        JoinByName();
        CollectBarriers();
        AddPlugins();
        SetTimes();
        SetBarriers();
        SetReleases();
        return std::move(timeline);
    }

private:
    using Places = std::vector<std::size_t>;

    // Of plugins of one name the first in the log is taken for the first of the model, and so on;
    // those that the model has filtered are taken last.
    void JoinByName() {
        std::map<std::string_view, Places> known;
        for (const bool filtered : {false, true}) {
            for (std::size_t plugin = 0; plugin < model.plugins.size(); ++plugin) {
                if ((model.plugins[plugin].fate == PluginFate::Filtered) == filtered) {
                    known[model.plugins[plugin].name].push_back(plugin);
                }
            }
        }
        std::map<std::string_view, std::size_t> seen;
        RemarkList repeated, unknown, unwanted;
        for (std::size_t index = 0; index < log.entries.size(); ++index) {
            const LogEntry& entry = log.entries[index];
            const std::size_t count = seen[entry.name]++;
            if (count == 1) {
                repeated.Add(entry.name);
            }
            const auto found = known.find(entry.name);
            if (found == known.end() || count >= found->second.size()) {
                unknown.Add(entry.name);
                continue;
            }
            pluginOf[index] = found->second[count];
            if (entry.WasRun() && model.plugins[pluginOf[index]].fate == PluginFate::Filtered) {
                unwanted.Add(entry.name);
            }
        }
        repeated.Tell("more than one plugin of this name, told apart by their order alone",
                      timeline.remarks);
        unknown.Tell("only in the log, taken to provide and require nothing", timeline.remarks);
        unwanted.Tell("run by the boot, but filtered by the options given here", timeline.remarks);
        TellUnlogged();
    }

    void TellUnlogged() {
        std::vector<bool> logged(model.plugins.size());
        for (const std::size_t plugin : pluginOf) {
            if (plugin != none) {
                logged[plugin] = true;
            }
        }
        RemarkList unlogged;
        for (std::size_t plugin = 0; plugin < model.plugins.size(); ++plugin) {
            if (logged[plugin]) {
                continue;
            }
            if (model.plugins[plugin].fate == PluginFate::Filtered) {
                bystanders.push_back(plugin);
            } else {
                unlogged.Add(model.plugins[plugin].name);
            }
        }
        unlogged.Tell("not in the log, left out", timeline.remarks);
    }

    void CollectBarriers() {
        std::map<std::string, std::size_t> places;
        const auto note = [&places](const PluginDescription& plugin) {
            for (const BarrierName& barrier : plugin.provided) {
                places.emplace(barrier.name, none);
            }
            for (const BarrierName& barrier : plugin.required) {
                places.emplace(barrier.name, none);
            }
        };
        for (const std::size_t plugin : pluginOf) {
            if (plugin != none) {
                note(model.plugins[plugin]);
            }
        }
        for (const std::size_t plugin : bystanders) {
            note(model.plugins[plugin]);
        }
        timeline.barriers.reserve(places.size());
        for (auto& [name, place] : places) {
            place = timeline.barriers.size();
            timeline.barriers.emplace_back().name = name;
        }
        barrierPlaces = std::move(places);
    }

    // Each barrier once, at the place where it is named first.
    Places PlacesOf(const std::vector<BarrierName>& names) {
        ++listsSeen;
        lastSeenIn.resize(timeline.barriers.size());
        Places places;
        for (const BarrierName& barrier : names) {
            const std::size_t place = barrierPlaces.at(barrier.name);
            if (std::exchange(lastSeenIn[place], listsSeen) != listsSeen) {
                places.push_back(place);
            }
        }
        return places;
    }

    void AddPlugins() {
        for (std::size_t index = 0; index < log.entries.size(); ++index) {
            const LogEntry& logged = log.entries[index];
            if (!logged.WasRun()) {
                if (pluginOf[index] != none) {
                    bystanders.push_back(pluginOf[index]);
                }
                continue;
            }
            TimelineEntry& entry = timeline.entries.emplace_back();
            entry.name = logged.name;
            entry.start = logged.start;
            entry.end = logged.end;
            if (pluginOf[index] != none) {
                entry.required = PlacesOf(model.plugins[pluginOf[index]].required);
                entry.provided = PlacesOf(model.plugins[pluginOf[index]].provided);
            }
        }
        for (const std::size_t plugin : bystanders) {
            TimelineBystander& bystander = timeline.bystanders.emplace_back();
            bystander.name = model.plugins[plugin].name;
            bystander.required = PlacesOf(model.plugins[plugin].required);
            bystander.provided = PlacesOf(model.plugins[plugin].provided);
        }
    }

    // Makes the moments relative to the first of them, which is the start of the run unless the
    // clock was set while it lasted.
    void SetTimes() {
        RemarkList backwards;
        Microseconds first = log.start;
        Microseconds last = std::max(log.start, log.end);
        for (TimelineEntry& entry : timeline.entries) {
            if (entry.end < entry.start) {
                backwards.Add(entry.name);
                entry.end = entry.start;
            }
            first = std::min(first, entry.start);
            last = std::max(last, entry.end);
        }
        backwards.Tell("ended before it started by the log, as the clock was set: taken to have "
                       "lasted no time",
                       timeline.remarks);
        if (first < log.start || last > log.end) {
            timeline.remarks.emplace_back(
                "some plugin ran outside the time from the start of the boot to its end by the "
                "log, as the clock was set: waits and gaps may be wrong");
        }
        timeline.end = last - first;
        Microseconds requested = timeline.end;
        for (TimelineEntry& entry : timeline.entries) {
            entry.start -= first;
            entry.end -= first;
            requested = std::min(requested, entry.start);
        }
        for (TimelineEntry& entry : timeline.entries) {
            entry.requested = requested;
            entry.released = requested;
        }
        for (TimelineBarrier& barrier : timeline.barriers) {
            barrier.done = requested;
        }
    }

    void SetBarriers() {
        for (std::size_t index = 0; index < timeline.entries.size(); ++index) {
            const TimelineEntry& entry = timeline.entries[index];
            for (const std::size_t barrier : entry.provided) {
                timeline.barriers[barrier].providers.push_back(index);
                timeline.barriers[barrier].done =
                    std::max(timeline.barriers[barrier].done, entry.end);
            }
            for (const std::size_t barrier : entry.required) {
                timeline.barriers[barrier].requirers.push_back(index);
            }
        }
    }

    void SetReleases() {
        RemarkList early;
        std::vector<std::size_t> lastProvider(timeline.barriers.size(), none);
        for (std::size_t place = 0; place < timeline.barriers.size(); ++place) {
            for (const std::size_t provider : timeline.barriers[place].providers) {
                std::size_t& last = lastProvider[place];
                if (last == none || timeline.entries[provider].end > timeline.entries[last].end) {
                    last = provider;
                }
            }
        }
        for (std::size_t index = 0; index < timeline.entries.size(); ++index) {
            TimelineEntry& entry = timeline.entries[index];
            bool hasStartedEarly = false;
            for (const std::size_t place : entry.required) {
                const TimelineBarrier& barrier = timeline.barriers[place];
                if (barrier.done > entry.start || lastProvider[place] == index) {
                    hasStartedEarly = true;
                } else if (lastProvider[place] != none &&
                           (entry.releasedBy == none || barrier.done > entry.released)) {
                    entry.released = barrier.done;
                    entry.releasedBy = lastProvider[place];
                    entry.releasedThrough = barrier.name;
                }
            }
            if (hasStartedEarly) {
                early.Add(entry.name);
            }
        }
        early.Tell("started before a barrier that it requires was done, as the clock was set or "
                   "the plugins have changed since",
                   timeline.remarks);
    }

    const BootLog& log;
    const BootModel& model;
    Places pluginOf;    // of each entry of the log: its plugin in the model, or none
    Places bystanders;  // plugins of the model
    std::map<std::string, std::size_t> barrierPlaces;
    Places lastSeenIn;  // of each barrier: the list that named it last
    std::size_t listsSeen = 0;
    BootTimeline timeline;
};

}  // namespace

Microseconds BootTimeline::Makespan() const {
    if (entries.empty()) {
        return 0;
    }
    Microseconds last = 0;
    for (const TimelineEntry& entry : entries) {
        last = std::max(last, entry.end);
    }
    return last - entries.front().requested;
}

Microseconds BootTimeline::Work() const {
    Microseconds work = 0;
    for (const TimelineEntry& entry : entries) {
        work += entry.Ran();
    }
    return work;
}

BootTimeline MakeTimeline(const BootLog& log, const BootModel& model) {
    return TimelineMaker(log, model).Make();
}

}  // namespace vantor::analyze
