#ifndef VANTOR_ANALYZE_BOOT_BOOTTIMELINE_H
#define VANTOR_ANALYZE_BOOT_BOOTTIMELINE_H

#include <cstddef>
#include <string>
#include <vector>

#include "boot/BootLog.h"
#include "model/BootModel.h"

namespace vantor::analyze {

// One plugin of a boot that has taken place: what the log says of its run and what the directory
// says of its barriers, put together. All times are microseconds since the start of the run.
struct TimelineEntry {
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    std::string name;
    // All plugins were loaded: the first start of any, for all the same.
    Microseconds requested = 0;
    Microseconds released = 0;  // its last barrier was done; `requested` when it waited for none
    Microseconds start = 0;
    Microseconds end = 0;
    // Barriers, as places in the timeline's list: in the order of the plugin's own, each once.
    std::vector<std::size_t> required;
    std::vector<std::size_t> provided;
    std::size_t releasedBy = none;  // the entry it waited for that ended last before its start
    std::string releasedThrough;    // the barrier between them

    // Neither is ever negative, and their sum is `start - requested`.
    Microseconds WaitedForBarriers() const { return released - requested; }
    Microseconds WaitedForWorker() const { return start - released; }
    Microseconds Ran() const { return end - start; }
};

// A barrier of a boot that has taken place: done when the last of its providers was.
struct TimelineBarrier {
    std::string name;
    Microseconds done = 0;               // when the first plugin started, where none was waited for
    std::vector<std::size_t> providers;  // entries, ascending; each once
    std::vector<std::size_t> requirers;
};

// A plugin that stood in the graph without being run: filtered, or run by an earlier boot. Nothing
// waited for it, but the program's choice looks at all chains of the graph, those through it too.
struct TimelineBystander {
    std::string name;
    std::vector<std::size_t> required;  // barriers, as of an entry
    std::vector<std::size_t> provided;
};

// A boot that has taken place. Entries are the plugins that were run, in the order of the log.
struct BootTimeline {
    std::vector<TimelineEntry> entries;
    std::vector<TimelineBystander> bystanders;
    std::vector<TimelineBarrier> barriers;  // by name; all, also those that no entry requires
    Microseconds end = 0;                   // of the whole run
    std::size_t workers = 1;                // 8 for a parallel boot, 1 for a serial one
    // What does not fit, a sentence each: plugins that only the log or only the model knows, names
    // that occur twice, ends before starts.
    std::vector<std::string> remarks;

    // From the first start to the last end of a plugin; 0 without plugins.
    Microseconds Makespan() const;
    // All runs added up.
    Microseconds Work() const;
};

// Puts a log and the plugins it came from together, by name. Where they differ the log holds: a
// barrier whose provider ended after a plugin had started is not what released the plugin. It may
// be that the plugins as they are now wait for each other in a circle. n log n in plugins and
// edges.
BootTimeline MakeTimeline(const BootLog& log, const BootModel& model);

}  // namespace vantor::analyze

#endif
