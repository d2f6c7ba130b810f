#include "verify/ProviderCheck.h"

#include <algorithm>
#include <optional>
#include <string>

#include "model/NearestName.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

NearestName ProvidedNames(const BootModel& model) {
    std::vector<std::string> names;
    for (const auto& [name, barrier] : model.barriers) {
        if (!barrier.providers.empty()) {
            names.push_back(name);
        }
    }
    return NearestName(names);
}

bool AnyRuns(const BootModel& model, const std::vector<std::size_t>& plugins) {
    return std::any_of(plugins.begin(), plugins.end(), [&](std::size_t plugin) {
        return model.plugins[plugin].fate == PluginFate::Runs;
    });
}

bool AllFiltered(const BootModel& model, const std::vector<std::size_t>& plugins) {
    return std::all_of(plugins.begin(), plugins.end(), [&](std::size_t plugin) {
        return model.plugins[plugin].fate == PluginFate::Filtered;
    });
}

// Where the first of those that require it says so, one that runs before one that does not.
Place PlaceOfRequirement(const BootModel& model, const std::string& name, const Barrier& barrier) {
    const auto running =
        std::find_if(barrier.requirers.begin(), barrier.requirers.end(), [&](std::size_t plugin) {
            return model.plugins[plugin].fate == PluginFate::Runs;
        });
    const PluginDescription& requirer =
        model.plugins[running != barrier.requirers.end() ? *running : barrier.requirers.front()];
    return PlaceOf(requirer, requirer.required, name);
}

Finding NoProvider(const BootModel& model, const std::string& name, const Barrier& barrier,
                   const std::string& nearest) {
    std::string text = "no plugin provides barrier " + QuotedBarrier(name) + ", required by " +
                       Enumerate(model, barrier.requirers);
    const bool matters = AnyRuns(model, barrier.requirers);
    if (!matters) {
        text += barrier.requirers.size() == 1 ? " (which does not run)" : " (none of which runs)";
    }
    if (!nearest.empty()) {
        text += "; did you mean " + QuotedBarrier(nearest) + "?";
    } else if (model.notLoaded.size() == 1) {
        text += "; " + model.notLoaded.front() + ", which the boot does not load, may provide it";
    } else if (!model.notLoaded.empty()) {
        text += "; one of the " + Counted(model.notLoaded.size(), "plugin file") +
                " that the boot does not load may provide it";
    }
    return {matters ? Severity::Error : Severity::Note, "no-provider",
            PlaceOfRequirement(model, name, barrier), std::move(text)};
}

Finding FilteredProvider(const BootModel& model, const std::string& name, const Barrier& barrier) {
    std::vector<std::string> reasons;
    for (const std::size_t provider : barrier.providers) {
        reasons.push_back(Reason(model.plugins[provider]));
    }
    return {Severity::Warning, "filtered-provider", PlaceOfRequirement(model, name, barrier),
            "nothing that runs provides barrier " + QuotedBarrier(name) + ", required by " +
                Enumerate(model, barrier.requirers) + ": " + Enumerate(reasons)};
}

}  // namespace

void CheckProviders(const BootModel& model, Findings& findings) {
    std::optional<NearestName> names;  // made when somebody asks
    for (const auto& [name, barrier] : model.barriers) {
        if (barrier.requirers.empty()) {
            continue;
        }
        if (barrier.providers.empty()) {
            if (!names) {
                names.emplace(ProvidedNames(model));
            }
            findings.push_back(NoProvider(model, name, barrier, names->Find(name)));
        } else if (AllFiltered(model, barrier.providers) && AnyRuns(model, barrier.requirers)) {
            findings.push_back(FilteredProvider(model, name, barrier));
        }
    }
}

}  // namespace vantor::analyze
