// Feeds the readers of profiling logs and of drawings whatever libFuzzer makes up, and what they
// read to all that is computed from it. An input is a log and, behind a zero byte, a drawing.

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <sstream>
#include <stdexcept>
#include <string>

#include "boot/Blame.h"
#include "boot/BootLog.h"
#include "boot/BootTimeline.h"
#include "boot/Comparison.h"
#include "boot/CriticalChain.h"
#include "boot/DotModel.h"
#include "boot/Lanes.h"
#include "boot/Simulation.h"
#include "boot/TraceWriter.h"

namespace vantor::analyze {
namespace {

void Require(bool fact, const char* what) {
    if (!fact) {
        std::fprintf(stderr, "%s\n", what);
        std::abort();
    }
}

void CheckTimes(const BootTimeline& timeline) {
    for (const TimelineEntry& entry : timeline.entries) {
        Require(entry.requested >= 0 && entry.WaitedForBarriers() >= 0 &&
                    entry.WaitedForWorker() >= 0 && entry.Ran() >= 0 && entry.end <= timeline.end,
                "a time is out of order");
    }
}

void CheckLanes(const BootTimeline& timeline) {
    const Lanes lanes = AssignLanes(timeline);
    for (std::size_t one = 0; one < timeline.entries.size(); ++one) {
        for (std::size_t other = 0; other < one; ++other) {
            Require(lanes.lane[one] != lanes.lane[other] ||
                        timeline.entries[one].start >= timeline.entries[other].end ||
                        timeline.entries[other].start >= timeline.entries[one].end,
                    "two plugins that ran at once share a lane");
        }
    }
}

void CheckChain(const BootTimeline& timeline) {
    const std::vector<ChainLink> chain = CriticalChain(timeline);
    Require(chain.empty() == timeline.entries.empty(), "a chain is missing");
    for (std::size_t link = 1; link < chain.size(); ++link) {
        Require(chain[link].release.by == chain[link - 1].entry &&
                    timeline.entries[chain[link - 1].entry].end <=
                        timeline.entries[chain[link].entry].start,
                "a link is released by none before it");
    }
}

void CheckFigures(const BootTimeline& timeline) {
    for (const BlameRow& row : Blame(timeline)) {
        Require(row.slack >= 0 && row.savesAtMost >= 0, "a figure is negative");
    }
    for (const std::size_t workers : {1U, 2U, 8U}) {
        const Prediction prediction = Simulation(timeline).Predict(workers);
        Require(prediction.makespan >= prediction.lowerBound &&
                    prediction.makespan <= prediction.work,
                "a prediction is outside of its bounds");
    }
}

BootModel ModelOf(const std::string& text) {
    std::istringstream stream(text);
    try {
        return ParseDotModel(stream, "drawing");
    } catch (const std::runtime_error&) {
        return {};
    }
}

void Use(const BootLog& log, const BootModel& model) {
    const BootTimeline timeline = MakeTimeline(log, model);
    CheckTimes(timeline);
    CheckLanes(timeline);
    CheckChain(timeline);
    std::ostringstream trace;
    WriteTrace(timeline, trace);
    const Comparison comparison = CompareBoots({log}, {log}, NoiseRule());
    Require(comparison.slower.empty() && comparison.faster.empty() && comparison.added.empty() &&
                comparison.removed.empty(),
            "a boot differs from itself");
    CheckFigures(timeline);
}

}  // namespace
}  // namespace vantor::analyze

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(data, data + size);
    const std::size_t end = text.find('\0');
    const std::string drawing = end == std::string::npos ? "" : text.substr(end + 1);
    const vantor::analyze::BootModel model = vantor::analyze::ModelOf(drawing);
    std::istringstream log(text.substr(0, end));
    try {
        vantor::analyze::Use(vantor::analyze::ParseBootLog(log, "log"), model);
    } catch (const std::runtime_error&) {
        // No log, or plugins that wait for each other in a circle.
    }
    return 0;
}
