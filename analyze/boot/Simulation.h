#ifndef VANTOR_ANALYZE_BOOT_SIMULATION_H
#define VANTOR_ANALYZE_BOOT_SIMULATION_H

#include <cstddef>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// What a number of workers would make of a boot.
struct Prediction {
    std::size_t workers = 0;
    Microseconds makespan = 0;  // from the first start to the last end of a plugin
    // No order whatever is shorter: the greater of the longest chain of runs and the work spread
    // evenly over all workers.
    Microseconds lowerBound = 0;
    Microseconds criticalPath = 0;
    Microseconds work = 0;             // all runs added up
    std::vector<Microseconds> starts;  // of each entry of the timeline

    // The share of the workers' time that they would spend on plugins; 1 for a boot of no length.
    double Efficiency() const;
};

// A boot that has taken place, to be run again with the same lengths of runs on a virtual clock:
// through the boot program's own graph and its own choice of the next plugin. Barriers, the choice
// and waking a worker take no time. One thread at a time in the process may predict.
class Simulation {
public:
    explicit Simulation(const BootTimeline& measured);

    // Every plugin of that name runs for `length`, from 0 to 10 years, instead of as measured.
    // Throws std::runtime_error when no such plugin was run.
    void SetRun(const std::string& name, Microseconds length);

    // Takes an edge out: "PLUGIN:BARRIER" and the plugin does not provide the barrier;
    // "BARRIER:PLUGIN" and the plugin does not require it. Names may hold colons; where the text
    // can be read as several edges all of them are taken out. Throws std::runtime_error when it
    // names no edge, which says whether it is the names that are unknown.
    void DropEdge(const std::string& edge);

    // Throws std::runtime_error when the plugins wait for each other in a circle.
    Prediction Predict(std::size_t workers) const;

private:
    bool DropEdge(const std::string& from, const std::string& to);
    bool IsKnown(const std::string& name) const;

    BootTimeline timeline;
    std::vector<Microseconds> runs;  // of each entry
};

}  // namespace vantor::analyze

#endif
