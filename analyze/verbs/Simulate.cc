#include "verbs/Simulate.h"

#include <fmt/format.h>

#include <charconv>
#include <cmath>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "boot/Simulation.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/Progress.h"
#include "verbs/TextTable.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

struct SimulateOptions {
    LogSource source;
    std::vector<std::size_t> workers{1, 8};
    std::vector<std::string> runs;
    std::vector<std::string> droppedEdges;
    std::string format = "text";
};

// NAME=SECONDS; a name may hold "=".
void SetRun(const std::string& text, Simulation& simulation) {
    constexpr double longest = 10.0 * 366 * 86400;
    const std::size_t sign = text.rfind('=');
    const std::string number = sign == std::string::npos ? "" : text.substr(sign + 1);
    double seconds = 0;
    const char* const last = number.data() + number.size();
    const auto [end, error] = std::from_chars(number.data(), last, seconds);
    if (error != std::errc() || end != last || !(seconds >= 0 && seconds <= longest)) {
        throw std::runtime_error("--what-if=" + text +
                                 ": it takes NAME=SECONDS, from 0 to 10 years");
    }
    simulation.SetRun(text.substr(0, sign), static_cast<Microseconds>(std::llround(seconds * 1e6)));
}

void WriteText(const BootTimeline& timeline, const std::vector<Prediction>& predictions,
               const Invocation& invocation) {
    using Kind = TextTable::Kind;
    const Prediction& first = predictions.front();
    invocation.out << fmt::format(
        "measured with {}: {} ms; simulated: {} ms of work, longest chain {} ms; all times in ms\n",
        Counted(timeline.workers, "worker"), Milliseconds(timeline.Makespan()),
        Milliseconds(first.work), Milliseconds(first.criticalPath));
    TextTable table({{"WORKERS", Kind::Number},
                     {"MAKESPAN", Kind::Number},
                     {"LOWER BOUND", Kind::Number},
                     {"EFFICIENCY", Kind::Number}});
    for (const Prediction& prediction : predictions) {
        table.Add({std::to_string(prediction.workers), Milliseconds(prediction.makespan),
                   Milliseconds(prediction.lowerBound),
                   fmt::format("{:.1f} %", prediction.Efficiency() * 100)});
    }
    table.Write(invocation.out, invocation.width);
}

Json Document(const BootTimeline& timeline, const std::vector<Prediction>& predictions) {
    Json list = Json::array();
    for (const Prediction& prediction : predictions) {
        list.push_back({{"workers", prediction.workers},
                        {"makespan", prediction.makespan},
                        {"lowerBound", prediction.lowerBound},
                        {"efficiency", prediction.Efficiency()}});
    }
    return {{"measured", {{"workers", timeline.workers}, {"makespan", timeline.Makespan()}}},
            {"work", predictions.front().work},
            {"criticalPath", predictions.front().criticalPath},
            {"predictions", std::move(list)},
            {"remarks", timeline.remarks}};
}

std::vector<Prediction> Predict(const SimulateOptions& options, const BootTimeline& timeline,
                                const Invocation& invocation) {
    const Progress progress(invocation, "simulating the boot");
    Simulation simulation(timeline);
    for (const std::string& run : options.runs) {
        SetRun(run, simulation);
    }
    for (const std::string& edge : options.droppedEdges) {
        simulation.DropEdge(edge);
    }
    std::vector<Prediction> predictions;
    for (const std::size_t workers : options.workers) {
        predictions.push_back(simulation.Predict(workers));
    }
    return predictions;
}

int Run(const SimulateOptions& options, const Invocation& invocation) {
    const BootTimeline timeline = options.source.Read(invocation);
    const std::vector<Prediction> predictions = Predict(options, timeline, invocation);
    if (options.format == "json") {
        WriteJson(Document(timeline, predictions), invocation.out);
    } else {
        WriteText(timeline, predictions, invocation);
        TellRemarks(timeline.remarks, invocation);
    }
    return statusClean;
}

}  // namespace

void AddSimulate(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<SimulateOptions>();
    CLI::App* const verb = app.add_subcommand(
        "simulate", "Predict how long the boot would take with other workers, runs or edges");
    AddLogOptions(*verb, options->source);
    verb->add_option("--workers", options->workers, "How many plugins may run at once")
        ->type_name("N[,N...]")
        ->delimiter(',')
        ->allow_extra_args(false)
        ->check(CLI::Range(1, 100000))
        ->capture_default_str();
    verb->add_option("--what-if", options->runs, "Let the plugin NAME run for so many SECONDS")
        ->type_name("NAME=SECONDS")
        ->allow_extra_args(false);
    verb->add_option("--drop-edge", options->droppedEdges,
                     "PLUGIN:BARRIER: it does not provide it; BARRIER:PLUGIN: nor require it")
        ->type_name("A:B")
        ->allow_extra_args(false);
    AddFormatOption(*verb, options->format);
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
