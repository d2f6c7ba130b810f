#include "verify/RequirementCheck.h"

#include <set>
#include <string>

#include "model/ImpliedRequirements.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

constexpr const char* implied = "implied-requirement";

void CheckUse(const BootModel& model, Findings& findings) {
    for (const auto& [name, barrier] : model.barriers) {
        if (barrier.requirers.empty()) {
            const PluginDescription& provider = model.plugins[barrier.providers.front()];
            findings.push_back({Severity::Note, "unused-barrier",
                                PlaceOf(provider, provider.provided, name),
                                "no plugin requires barrier " + QuotedBarrier(name) +
                                    ", provided by " + Enumerate(model, barrier.providers)});
        }
    }
}

void CheckRepetitions(const BootModel& model, Findings& findings) {
    for (const PluginDescription& plugin : model.plugins) {
        std::set<std::string> seen;
        std::set<std::string> told;
        for (const BarrierName& barrier : plugin.required) {
            if (!seen.insert(barrier.name).second && told.insert(barrier.name).second) {
                findings.push_back(
                    {Severity::Note, implied, barrier.place.line > 0 ? barrier.place : plugin.place,
                     Quoted(plugin) + " requires " + QuotedBarrier(barrier.name) + " repeatedly"});
            }
        }
    }
}

void CheckImplied(const BootModel& model, Findings& findings) {
    const ImpliedRequirements requirements =
        FindImpliedRequirements(BootGraph(model, GraphScope::All));
    for (const ImpliedRequirement& requirement : requirements.found) {
        const PluginDescription& plugin = model.plugins[requirement.plugin];
        findings.push_back({Severity::Note, implied,
                            PlaceOf(plugin, plugin.required, requirement.barrier),
                            Quoted(plugin) + " requires " + QuotedBarrier(requirement.barrier) +
                                ", which is always done before " +
                                QuotedBarrier(requirement.impliedBy) + ", which it requires too"});
    }
    if (!requirements.endedAt.empty()) {
        findings.push_back({Severity::Note,
                            implied,
                            {},
                            "the graph is too large to look for all implied requirements: none of "
                            "barrier " +
                                QuotedBarrier(requirements.endedAt) +
                                " and of those behind it in byte order was looked for"});
    }
}

}  // namespace

void CheckRequirements(const BootModel& model, Findings& findings) {
    CheckUse(model, findings);
    CheckRepetitions(model, findings);
    CheckImplied(model, findings);
}

}  // namespace vantor::analyze
