#include "verify/Explanation.h"

#include <algorithm>
#include <iterator>
#include <set>
#include <stdexcept>
#include <vector>

#include "model/BootGraph.h"
#include "model/NearestName.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

using Plugins = std::vector<std::size_t>;

const char* KindName(PluginKind kind) {
    switch (kind) {
    case PluginKind::Native:
        return "a native plugin";
    case PluginKind::Json:
        return "a JSON plugin";
    case PluginKind::Debug:
        break;
    }
    return "a debug plugin";
}

std::string QuotedFlags(const std::set<std::string>& flags) {
    std::vector<std::string> quoted;
    quoted.reserve(flags.size());
    for (const std::string& flag : flags) {
        quoted.push_back("'" + flag + "'");
    }
    return Enumerate(quoted);
}

// Each name once, in the order of the list.
std::vector<std::string> Distinct(const std::vector<BarrierName>& list) {
    std::set<std::string> seen;
    std::vector<std::string> names;
    for (const BarrierName& barrier : list) {
        if (seen.insert(barrier.name).second) {
            names.push_back(barrier.name);
        }
    }
    return names;
}

class Explainer {
public:
    Explainer(const BootModel& told, std::ostream& target, bool colours)
        : model(told),
          graph(told, GraphScope::Waiting),
          backward(graph.Edges().Reversed()),
          components(FindComponents(graph.Edges())),
          sizes(components.count),
          stream(target),
          colour(colours) {
        for (const std::size_t component : components.of) {
            ++sizes[component];
        }
    }

    bool Tell(const std::string& name) {
        const Plugins plugins = graph.PluginsNamed(name);
        for (const std::size_t plugin : plugins) {
            TellPlugin(plugin);
        }
        const Digraph::Node barrier = graph.BarrierNamed(name);
        if (barrier != graph.Edges().Size()) {
            TellBarrier(barrier);
        }
        return !plugins.empty() || barrier != graph.Edges().Size();
    }

private:
    static constexpr std::size_t labelWidth = 18;

    void Head(const std::string& text) {
        stream << (isFirst ? "" : "\n") << (colour ? "\x1b[1m" : "") << OnOneLine(text)
               << (colour ? "\x1b[0m" : "") << '\n';
        isFirst = false;
    }

    // One line for each text; only the first carries the label.
    void Line(std::string label, const std::vector<std::string>& texts) {
        for (const std::string& text : texts) {
            label.resize(labelWidth, ' ');
            stream << "  " << label << OnOneLine(text) << '\n';
            label.clear();
        }
    }
    void Line(const std::string& label, const std::string& text) {
        Line(label, std::vector<std::string>{text});
    }

    void TellPlugin(std::size_t node) {
        const PluginDescription& plugin = model.plugins[node];
        Head("plugin " + Quoted(plugin));
        Line("comes from", Spelled(plugin.place) + ", " + KindName(plugin.kind));
        TellConditions(plugin);
        Line("runs", Fate(node));
        TellRequired(plugin);
        TellProvided(plugin);
        if (plugin.fate == PluginFate::Runs) {
            Line("in all", Extent(node));
        }
        Line(plugin.fate == PluginFate::Filtered ? "as it is" : "were it disabled", Orphans(node));
    }

    void TellConditions(const PluginDescription& plugin) {
        std::vector<std::string> conditions;
        if (!plugin.requiredFlags.empty()) {
            conditions.push_back("only with the boot flags " + QuotedFlags(plugin.requiredFlags));
        }
        if (!plugin.disablingFlags.empty()) {
            conditions.push_back("not with any of the boot flags " +
                                 QuotedFlags(plugin.disablingFlags));
        }
        if (plugin.runOnce) {
            conditions.push_back("once for each of its versions, this being '" +
                                 plugin.pluginVersion + "'");
        }
        Line("is to run", conditions);
    }

    std::string Fate(Digraph::Node node) const {
        const PluginDescription& plugin = model.plugins[node];
        if (plugin.fate != PluginFate::Runs) {
            return "no: " + Reason(plugin);
        }
        return Hindrance(node).empty() ? "yes" : "never: " + Hindrance(node);
    }

    // What keeps a node from ever becoming ready; empty when nothing does.
    std::string Hindrance(Digraph::Node node) const {
        if (IsOnCycle(node)) {
            return "it waits for itself, on a dependency cycle";
        }
        for (const Digraph::Node before : Reached(backward, node)) {
            if (IsOnCycle(before) && graph.IsPlugin(before)) {
                return "it waits for " + Quoted(model.plugins[before]) +
                       ", which is on a dependency cycle";
            }
        }
        return {};
    }

    bool IsOnCycle(Digraph::Node node) const { return sizes[components.of[node]] > 1; }

    // All that can be reached from a node, ascending; the node itself only on a cycle.
    static std::vector<Digraph::Node> Reached(const Digraph& edges, Digraph::Node from) {
        std::vector<char> seen(edges.Size());
        std::vector<Digraph::Node> reached;
        std::vector<Digraph::Node> open{from};
        while (!open.empty()) {
            const Digraph::Node node = open.back();
            open.pop_back();
            for (const Digraph::Node target : edges.From(node)) {
                if (seen[target] == 0) {
                    seen[target] = 1;
                    reached.push_back(target);
                    open.push_back(target);
                }
            }
        }
        std::sort(reached.begin(), reached.end());
        return reached;
    }

    std::size_t PluginsReached(const Digraph& edges, Digraph::Node from) const {
        const std::vector<Digraph::Node> reached = Reached(edges, from);
        return static_cast<std::size_t>(
            std::count_if(reached.begin(), reached.end(), [&](Digraph::Node node) {
                return node != from && graph.IsPlugin(node);
            }));
    }

    std::string Extent(Digraph::Node node) const {
        const std::size_t behind = PluginsReached(graph.Edges(), node);
        return "waits for " + Counted(PluginsReached(backward, node), "plugin") + "; " +
               Counted(behind, "plugin") + (behind == 1 ? " waits" : " wait") + " for it";
    }

    // Their names; of those that do not run, that they do not.
    std::string Listed(const Plugins& plugins) const {
        if (plugins.empty()) {
            return "nobody";
        }
        std::vector<std::string> names;
        for (const std::size_t plugin : plugins) {
            const PluginFate fate = model.plugins[plugin].fate;
            names.push_back(Quoted(model.plugins[plugin]) +
                            (fate == PluginFate::Filtered     ? " (filtered out)"
                             : fate == PluginFate::AlreadyRun ? " (has already run)"
                                                              : ""));
        }
        return Enumerate(names);
    }

    void TellRequired(const PluginDescription& plugin) {
        std::vector<std::string> lines;
        for (const std::string& name : Distinct(plugin.required)) {
            lines.push_back(QuotedBarrier(name) + ", provided by " +
                            Listed(model.barriers.at(name).providers));
        }
        Line("waits for", lines.empty() ? std::vector<std::string>{"nothing"} : lines);
    }

    void TellProvided(const PluginDescription& plugin) {
        std::vector<std::string> lines;
        for (const std::string& name : Distinct(plugin.provided)) {
            lines.push_back(QuotedBarrier(name) + ", required by " +
                            Listed(model.barriers.at(name).requirers));
        }
        Line("provides", lines.empty() ? std::vector<std::string>{"nothing"} : lines);
    }

    Plugins Running(const Plugins& plugins) const {
        Plugins running;
        std::copy_if(
            plugins.begin(), plugins.end(), std::back_inserter(running),
            [&](std::size_t plugin) { return model.plugins[plugin].fate == PluginFate::Runs; });
        return running;
    }

    // Whether all that provide a barrier are filtered out, or are the plugin.
    bool DependsOnlyOn(std::size_t plugin, const Barrier& barrier) const {
        return std::all_of(
            barrier.providers.begin(), barrier.providers.end(), [&](std::size_t provider) {
                return provider == plugin || model.plugins[provider].fate == PluginFate::Filtered;
            });
    }

    std::vector<std::string> Orphans(std::size_t plugin) const {
        std::vector<std::string> lines;
        const bool isFiltered = model.plugins[plugin].fate == PluginFate::Filtered;
        for (const std::string& name : Distinct(model.plugins[plugin].provided)) {
            const Barrier& barrier = model.barriers.at(name);
            Plugins left = Running(barrier.requirers);
            left.erase(std::remove(left.begin(), left.end(), plugin), left.end());
            if (!left.empty() && DependsOnlyOn(plugin, barrier)) {
                lines.push_back(Enumerate(model, left) +
                                (isFiltered ? left.size() == 1 ? " is" : " are" : " would be") +
                                " left waiting for nothing at " + QuotedBarrier(name));
            }
        }
        if (lines.empty()) {
            lines.push_back(isFiltered ? "nobody is left waiting for nothing"
                                       : "nobody would be left waiting for nothing");
        }
        return lines;
    }

    void TellBarrier(Digraph::Node node) {
        const Barrier& barrier = graph.BarrierOf(node);
        Head("barrier " + QuotedBarrier(graph.BarrierName(node)));
        std::vector<std::string> providers;
        for (const std::size_t provider : barrier.providers) {
            const PluginDescription& plugin = model.plugins[provider];
            const std::string place = Spelled(PlaceOf(plugin, plugin.provided, graph.Name(node)));
            providers.push_back(Quoted(plugin) + ", " + place +
                                (plugin.fate == PluginFate::Runs ? "" : ", " + Reason(plugin)));
        }
        Line("provided by", providers.empty() ? std::vector<std::string>{"nobody"} : providers);
        Line("required by", Listed(barrier.requirers));
        const std::string hindrance = Hindrance(node);
        Line("is reached", !hindrance.empty()          ? "never: " + hindrance
                           : barrier.providers.empty() ? "at once, with a system alert when "
                                                         "somebody requires it"
                                                       : "yes");
        Line("in all", Extent(node));
        Line("as it is", Left(node));
    }

    // What disabling one of a barrier's providers would do to those that require it.
    std::string Left(Digraph::Node node) const {
        const Barrier& barrier = graph.BarrierOf(node);
        const Plugins left = Running(barrier.requirers);
        if (left.empty()) {
            return "nobody waits for it";
        }
        for (const std::size_t provider : barrier.providers) {
            if (model.plugins[provider].fate != PluginFate::Filtered) {
                return DependsOnlyOn(provider, barrier)
                           ? "were " + Quoted(model.plugins[provider]) + " disabled, " +
                                 Enumerate(model, left) + " would be left waiting for nothing"
                           : "no single plugin's disabling would leave anybody waiting for nothing";
            }
        }
        return Enumerate(model, left) + (left.size() == 1 ? " is" : " are") +
               " left waiting for nothing";
    }

    const BootModel& model;
    const BootGraph graph;
    const Digraph backward;
    const Components components;
    std::vector<std::size_t> sizes;
    std::ostream& stream;
    bool colour;
    bool isFirst = true;
};

// The name that the boot gives to the plugin of a file.
std::string PluginNameOf(const std::string& path) {
    std::string name = path.substr(path.rfind('/') + 1);
    name = name.substr(0, name.rfind('.'));
    return name.compare(0, 3, "lib") == 0 ? name.substr(3) : name;
}

}  // namespace

void Explain(const BootModel& model, const Findings& findings, const std::string& name,
             std::ostream& stream, bool colour) {
    Explainer explainer(model, stream, colour);
    if (explainer.Tell(name)) {
        return;
    }
    const auto plugin = std::find_if(
        model.plugins.begin(), model.plugins.end(), [&](const PluginDescription& candidate) {
            const std::string& path = candidate.place.path;
            return candidate.kind != PluginKind::Debug &&
                   (path == name || path.substr(path.rfind('/') + 1) == name);
        });
    if (plugin == model.plugins.end()) {
        throw std::runtime_error(UnknownName(model, findings, name));
    }
    explainer.Tell(plugin->name);
}

std::string UnknownName(const BootModel& model, const Findings& findings, const std::string& name) {
    std::string text = "no plugin and no barrier has the name '" + name + "'";
    for (const Finding& finding : findings) {
        if (finding.severity != Severity::Note && PluginNameOf(finding.place.path) == name) {
            return text + "; " + Spelled(finding.place) + ": " + finding.text;
        }
    }
    std::vector<std::string> plugins;
    for (const PluginDescription& plugin : model.plugins) {
        plugins.push_back(plugin.name);
    }
    std::vector<std::string> barriers;
    for (const auto& [barrier, links] : model.barriers) {
        barriers.push_back(barrier);
    }
    std::vector<std::string> nearest;
    if (const std::string plugin = NearestName(plugins).Find(name); !plugin.empty()) {
        nearest.push_back("plugin '" + plugin + "'");
    }
    if (const std::string barrier = NearestName(barriers).Find(name); !barrier.empty()) {
        nearest.push_back("barrier " + QuotedBarrier(barrier));
    }
    if (nearest.empty()) {
        return text;
    }
    return text + "; did you mean " + nearest.front() +
           (nearest.size() > 1 ? " or " + nearest.back() : "") + "?";
}

}  // namespace vantor::analyze
