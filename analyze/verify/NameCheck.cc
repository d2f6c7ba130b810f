#include "verify/NameCheck.h"

#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

using Plugins = std::vector<std::size_t>;

// Each debug entry once.
Plugins Distinct(const BootModel& model, const Plugins& plugins) {
    Plugins distinct;
    std::set<std::pair<std::string, int>> entries;
    for (const std::size_t plugin : plugins) {
        const PluginDescription& described = model.plugins[plugin];
        if (described.kind != PluginKind::Debug || described.place.line == 0 ||
            entries.emplace(described.place.path, described.place.line).second) {
            distinct.push_back(plugin);
        }
    }
    return distinct;
}

bool ShareRunOnceKey(const BootModel& model, const Plugins& plugins) {
    std::set<std::string> versions;
    for (const std::size_t plugin : plugins) {
        const PluginDescription& described = model.plugins[plugin];
        if (described.runOnce && !versions.insert(described.pluginVersion).second) {
            return true;
        }
    }
    return false;
}

void Tell(const BootModel& model, const Plugins& plugins, Findings& findings) {
    std::vector<std::string> places;
    for (const std::size_t plugin : plugins) {
        places.push_back(Spelled(model.plugins[plugin].place));
    }
    const PluginDescription& first = model.plugins[plugins.front()];
    const bool runsOne = ShareRunOnceKey(model, plugins);
    findings.push_back({runsOne ? Severity::Error : Severity::Warning, "duplicate-name",
                        first.place,
                        Counted(plugins.size(), "plugin") + " of the name " + Quoted(first) + ": " +
                            Enumerate(places) +
                            (runsOne ? "; of run-once plugins of one name and version the boot "
                                       "runs only the first that the directory lists"
                                     : "")});
}

}  // namespace

void CheckNames(const BootModel& model, Findings& findings) {
    std::map<std::string, Plugins> byName;
    for (std::size_t plugin = 0; plugin < model.plugins.size(); ++plugin) {
        byName[model.plugins[plugin].name].push_back(plugin);
    }
    for (const auto& [name, plugins] : byName) {
        const Plugins distinct = Distinct(model, plugins);
        if (distinct.size() > 1) {
            Tell(model, distinct, findings);
        }
    }
}

}  // namespace vantor::analyze
