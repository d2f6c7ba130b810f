#include "verbs/Diff.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <iterator>
#include <memory>
#include <optional>
#include <set>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "boot/Comparison.h"
#include "boot/CriticalChain.h"
#include "boot/DotModel.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/Progress.h"
#include "verbs/TextTable.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

struct DiffOptions {
    std::vector<std::string> pair;  // OLD NEW
    std::vector<std::string> before;
    std::vector<std::string> after;
    BootSource plugins;
    std::string dot;  // of both sides
    std::string dotBefore;
    std::string dotAfter;
    double leastMilliseconds = 5;
    double marginPercent = 10;
    double failOver = -1;  // per cent; negative: no gate
    std::string format = "text";
};

// What has come onto the critical chain and what has left it; by the boot of the median length of
// each side.
struct ChainChange {
    std::vector<std::string> joined;
    std::vector<std::string> left;
};

struct Result {
    Comparison comparison;
    std::optional<ChainChange> chain;  // none without the plugins of both sides
    std::vector<std::string> remarks;
};

std::vector<BootLog> ReadLogs(const std::vector<std::string>& paths) {
    std::vector<BootLog> logs;
    logs.reserve(paths.size());
    for (const std::string& path : paths) {
        logs.push_back(ReadBootLog(path));
    }
    return logs;
}

std::optional<BootModel> ReadPluginsOf(const DiffOptions& options, const std::string& dot,
                                       std::vector<std::string>& remarks) {
    if (!dot.empty() || !options.dot.empty()) {
        return ReadDotModel(dot.empty() ? options.dot : dot);
    }
    return ReadPluginsIfThere(options.plugins, remarks);
}

// The names on the chain of a side's median boot; the timeline's remarks go to `remarks`.
std::set<std::string> ChainOf(const std::vector<BootLog>& logs, const BootModel& model,
                              const char* side, std::vector<std::string>& remarks) {
    const BootTimeline timeline = MakeTimeline(logs[MedianBoot(logs)], model);
    for (const std::string& remark : timeline.remarks) {
        remarks.push_back(std::string(side) + " boot: " + remark);
    }
    std::set<std::string> names;
    for (const ChainLink& link : CriticalChain(timeline)) {
        names.insert(timeline.entries[link.entry].name);
    }
    return names;
}

std::vector<std::string> OnlyIn(const std::set<std::string>& one,
                                const std::set<std::string>& other) {
    std::vector<std::string> names;
    std::set_difference(one.begin(), one.end(), other.begin(), other.end(),
                        std::back_inserter(names));
    return names;
}

std::optional<ChainChange> CompareChains(const DiffOptions& options,
                                         const std::vector<BootLog>& before,
                                         const std::vector<BootLog>& after,
                                         std::vector<std::string>& remarks) {
    const std::optional<BootModel> old = ReadPluginsOf(options, options.dotBefore, remarks);
    // What is to be said of one directory is said once.
    std::vector<std::string> sameRemarks;
    const std::optional<BootModel> now =
        ReadPluginsOf(options, options.dotAfter, options.dotBefore.empty() ? sameRemarks : remarks);
    if (!old || !now) {
        return std::nullopt;
    }
    const std::set<std::string> oldChain = ChainOf(before, *old, "old", remarks);
    const std::set<std::string> newChain = ChainOf(after, *now, "new", remarks);
    return ChainChange{OnlyIn(newChain, oldChain), OnlyIn(oldChain, newChain)};
}

std::string Signed(Microseconds time) { return (time > 0 ? "+" : "") + Milliseconds(time); }

std::string GrowthText(const Change& change) {
    return std::isinf(change.Growth()) ? "from nothing"
                                       : fmt::format("{:+.1f} %", change.Growth() * 100);
}

std::string NameList(const std::vector<std::string>& names) {
    return names.empty() ? "none" : OnOneLine(fmt::format("{}", fmt::join(names, ", ")));
}

void WriteTable(const Comparison& comparison, const Invocation& invocation) {
    using Kind = TextTable::Kind;
    TextTable table({{"CHANGE", Kind::Number},
                     {"OLD", Kind::Number},
                     {"NEW", Kind::Number},
                     {"DIFFERENCE", Kind::Number},
                     {"NOISE", Kind::Number},
                     {"PLUGIN", Kind::Name}});
    const auto addNames = [&table](const char* what, const std::vector<std::string>& names) {
        for (const std::string& name : names) {
            table.Add({what, "-", "-", "-", "-", name});
        }
    };
    const auto addChanges = [&table](const char* what, const std::vector<PluginChange>& changes) {
        for (const PluginChange& change : changes) {
            table.Add({what, Milliseconds(change.run.before), Milliseconds(change.run.after),
                       Signed(change.run.Difference()), Milliseconds(change.run.noise),
                       change.name});
        }
    };
    addChanges("slower", comparison.slower);
    addChanges("faster", comparison.faster);
    addNames("added", comparison.added);
    addNames("removed", comparison.removed);
    addNames("now run", comparison.nowRun);
    addNames("no longer run", comparison.noLongerRun);
    table.Write(invocation.out, invocation.width);
}

void WriteText(const Result& result, const Invocation& invocation) {
    const Comparison& comparison = result.comparison;
    const Change& total = comparison.total;
    invocation.out << fmt::format(
        "{} before, {} after; all times in ms, medians where there are several\n"
        "total: {} before, {} after, {} ({}), {}\n",
        Counted(comparison.boots[0], "boot"), Counted(comparison.boots[1], "boot"),
        Milliseconds(total.before), Milliseconds(total.after), Signed(total.Difference()),
        GrowthText(total),
        total.IsSlower()   ? "slower"
        : total.IsFaster() ? "faster"
                           : "within the noise of " + Milliseconds(total.noise));
    WriteTable(comparison, invocation);
    invocation.out << fmt::format("unchanged: {}\n", Counted(comparison.unchanged, "plugin"));
    if (!result.chain) {
        invocation.out << "critical chain: not compared, as the plugins are not there "
                          "(--directory, --dot)\n";
    } else {
        invocation.out << "onto the critical chain: " << NameList(result.chain->joined) << '\n'
                       << "off the critical chain: " << NameList(result.chain->left) << '\n';
    }
    TellRemarks(result.remarks, invocation);
}

Json ToJson(const Change& change) {
    return {{"old", change.before},
            {"new", change.after},
            {"difference", change.Difference()},
            {"noise", change.noise},
            {"oldSpread", change.beforeSpread},
            {"newSpread", change.afterSpread}};
}

Json ToJson(const std::vector<PluginChange>& changes) {
    Json list = Json::array();
    for (const PluginChange& change : changes) {
        Json item{{"plugin", change.name}};
        item.update(ToJson(change.run));
        list.push_back(std::move(item));
    }
    return list;
}

Json Document(const Result& result) {
    const Comparison& comparison = result.comparison;
    Json document{{"oldBoots", comparison.boots[0]},
                  {"newBoots", comparison.boots[1]},
                  {"total", ToJson(comparison.total)},
                  {"slower", ToJson(comparison.slower)},
                  {"faster", ToJson(comparison.faster)},
                  {"added", comparison.added},
                  {"removed", comparison.removed},
                  {"nowRun", comparison.nowRun},
                  {"noLongerRun", comparison.noLongerRun},
                  {"unchanged", comparison.unchanged},
                  {"chain", nullptr}};
    if (result.chain) {
        document["chain"] = {{"joined", result.chain->joined}, {"left", result.chain->left}};
    }
    document["remarks"] = result.remarks;
    return document;
}

Result CompareSides(const DiffOptions& options, const Invocation& invocation) {
    std::vector<std::string> oldPaths = options.before;
    std::vector<std::string> newPaths = options.after;
    if (options.pair.size() == 2 && oldPaths.empty() && newPaths.empty()) {
        oldPaths = {options.pair[0]};
        newPaths = {options.pair[1]};
    } else if (!options.pair.empty() || oldPaths.empty() || newPaths.empty()) {
        throw std::runtime_error("diff takes two logs, OLD and NEW, or one or several for each "
                                 "of --old and --new");
    }
    const Progress progress(invocation, "comparing the boots");
    const std::vector<BootLog> before = ReadLogs(oldPaths);
    const std::vector<BootLog> after = ReadLogs(newPaths);
    const NoiseRule rule{static_cast<Microseconds>(std::llround(options.leastMilliseconds * 1000)),
                         options.marginPercent / 100};
    Result result{CompareBoots(before, after, rule), std::nullopt, {}};
    result.chain = CompareChains(options, before, after, result.remarks);
    return result;
}

int Run(const DiffOptions& options, const Invocation& invocation) {
    const Result result = CompareSides(options, invocation);
    if (options.format == "json") {
        WriteJson(Document(result), invocation.out);
    } else {
        WriteText(result, invocation);
    }
    const Change& total = result.comparison.total;
    const bool fails =
        options.failOver >= 0 && total.IsSlower() && total.Growth() * 100 > options.failOver;
    if (fails) {
        invocation.error << fmt::format("vantor-analyze: the total grew by more than {} %\n",
                                        options.failOver);
    }
    return fails ? statusErrors : statusClean;
}

// A number from 0 to `most`; "nan" is not.
CLI::Validator UpTo(double most) {
    return CLI::Validator(
        [most](std::string& text) {
            std::istringstream stream(text);
            double number = 0;
            const bool fits = stream >> number &&
                              stream.peek() == std::istringstream::traits_type::eof() &&
                              number >= 0 && number <= most;
            return fits ? std::string() : fmt::format("{} is no number from 0 to {:g}", text, most);
        },
        "");
}

void AddOptions(CLI::App& verb, DiffOptions& options) {
    verb.add_option("LOGS", options.pair, "The logs of two boots: OLD NEW")
        ->expected(0, 2)
        ->check(HasName());
    verb.add_option("--old", options.before, "Logs of several boots of old")->type_name("LOG...");
    verb.add_option("--new", options.after, "Logs of several new boots")->type_name("LOG...");
    AddBootOptions(verb, options.plugins, DirectoryAs::Option);
    verb.add_option("--dot", options.dot, "A drawing of the plugins, in place of a directory")
        ->type_name("FILE")
        ->check(HasName());
    verb.add_option("--old-dot", options.dotBefore, "A drawing of the old plugins")
        ->type_name("FILE")
        ->check(HasName());
    verb.add_option("--new-dot", options.dotAfter, "A drawing of the new plugins")
        ->type_name("FILE")
        ->check(HasName());
    verb.add_option("--least", options.leastMilliseconds,
                    "Differences up to so many milliseconds are noise")
        ->type_name("MS")
        ->check(UpTo(1e9))
        ->capture_default_str();
    verb.add_option("--margin", options.marginPercent,
                    "With one boot on a side, differences up to so many per cent are noise")
        ->type_name("PERCENT")
        ->check(UpTo(1e6))
        ->capture_default_str();
    verb.add_option("--fail-over", options.failOver,
                    "Exit with status 2 when the total grew by more per cent")
        ->type_name("PERCENT")
        ->check(UpTo(1e6));
    AddFormatOption(verb, options.format);
}

}  // namespace

void AddDiff(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<DiffOptions>();
    CLI::App* const verb =
        app.add_subcommand("diff", "Compare two boots, or several on either side");
    AddOptions(*verb, *options);
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
