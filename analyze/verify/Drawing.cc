#include "verify/Drawing.h"

#include <algorithm>
#include <map>

#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

// The length of the UTF-8 sequence at `position`; 0 when there is none (RFC 3629).
std::size_t SequenceLength(const std::string& text, std::size_t position) {
    const auto byteAt = [&](std::size_t i) {
        return i < text.size() ? static_cast<unsigned char>(text[i]) : 0U;
    };
    const unsigned first = byteAt(position);
    const unsigned second = byteAt(position + 1);
    const std::size_t length = first < 0x80   ? 1
                               : first < 0xc2 ? 0
                               : first < 0xe0 ? 2
                               : first < 0xf0 ? 3
                               : first < 0xf5 ? 4
                                              : 0;
    for (std::size_t i = 1; i < length; ++i) {
        if ((byteAt(position + i) & 0xc0) != 0x80) {
            return 0;
        }
    }
    const bool isWrong = (first == 0xe0 && second < 0xa0) || (first == 0xed && second >= 0xa0) ||
                         (first == 0xf0 && second < 0x90) || (first == 0xf4 && second >= 0x90);
    return isWrong ? 0 : length;
}

// The text with quotes and backslashes escaped and what cannot be shown written out.
std::string EscapeQuoted(const std::string& text) {
    constexpr const char* digits = "0123456789abcdef";
    std::string escaped;
    for (std::size_t i = 0; i < text.size();) {
        const auto byte = static_cast<unsigned char>(text[i]);
        const std::size_t length = SequenceLength(text, i);
        if (length == 0 || byte < 0x20 || byte == 0x7f) {
            escaped += {'\\', '\\', 'x', digits[byte / 16], digits[byte % 16]};
            ++i;
            continue;
        }
        if (byte == '"' || byte == '\\') {
            escaped += '\\';
        }
        escaped.append(text, i, length);
        i += length;
    }
    return escaped;
}

class Drawing {
public:
    Drawing(const BootGraph& drawn, const Shown& nodes, std::ostream& target)
        : graph(drawn), shown(nodes), stream(target), ids(drawn.Edges().Size()) {
        FindCycles();
        NameNodes();
    }

    void Write() {
        stream << "digraph vantor {\n";
        for (Digraph::Node node = 0; node < ids.size(); ++node) {
            if (shown[node] != 0) {
                stream << "  " << ids[node] << " [label=\"" << EscapeLabel(graph.Name(node)) << '"'
                       << (graph.IsPlugin(node) ? PluginStyle(node) : BarrierStyle(node)) << "];\n";
            }
        }
        for (Digraph::Node node = 0; node < ids.size(); ++node) {
            for (const Digraph::Node target : graph.Edges().From(node)) {
                if (shown[node] != 0 && shown[target] != 0) {
                    stream << "  " << ids[node] << " -> " << ids[target] << EdgeStyle(node, target)
                           << ";\n";
                }
            }
        }
        stream << "}\n";
    }

private:
    void FindCycles() {
        components = FindComponents(BootGraph(graph.Model(), GraphScope::Waiting).Edges());
        sizes.resize(components.count);
        for (const std::size_t component : components.of) {
            ++sizes[component];
        }
    }

    void NameNodes() {
        std::map<std::string, std::size_t> seen;
        for (Digraph::Node node = 0; node < ids.size(); ++node) {
            std::string kind = "barrier";
            if (graph.IsPlugin(node)) {
                const std::size_t number = ++seen[graph.Name(node)];
                kind = number == 1 ? "plugin" : "plugin" + std::to_string(number);
            }
            ids[node] = '"' + kind + ':' + EscapeQuoted(graph.Name(node)) + '"';
        }
    }

    bool IsOnCycle(Digraph::Node node) const { return sizes[components.of[node]] > 1; }
    bool IsIdle(Digraph::Node node) const {
        return graph.IsPlugin(node) && graph.Plugin(node).fate != PluginFate::Runs;
    }

    std::string PluginStyle(Digraph::Node node) const {
        std::string tooltip = Spelled(graph.Plugin(node).place);
        std::string style;
        if (IsIdle(node)) {
            tooltip += (tooltip.empty() ? "" : ": ") + Reason(graph.Plugin(node));
            style = " style=filled fillcolor=gray90 color=gray fontcolor=gray40";
        } else if (IsOnCycle(node)) {
            style = " color=red fontcolor=red";
        }
        return (tooltip.empty() ? "" : " tooltip=\"" + EscapeLabel(tooltip) + '"') + style;
    }

    std::string BarrierStyle(Digraph::Node node) const {
        return std::string(" shape=box") +
               (graph.BarrierOf(node).providers.empty() ? " style=dashed" : "") +
               (IsOnCycle(node) ? " color=red fontcolor=red" : "");
    }

    // Plugins and barriers take turns, so every edge within a component is part of a cycle.
    const char* EdgeStyle(Digraph::Node from, Digraph::Node to) const {
        if (IsIdle(from) || IsIdle(to)) {
            return " [color=gray style=dashed]";
        }
        return components.of[from] == components.of[to] ? " [color=red]" : "";
    }

    const BootGraph& graph;
    const Shown& shown;
    std::ostream& stream;
    std::vector<std::string> ids;
    Components components;
    std::vector<std::size_t> sizes;
};

void Reach(const Digraph& edges, const std::vector<Digraph::Node>& centres, std::size_t depth,
           Shown& shown) {
    std::vector<char> seen(edges.Size());
    std::vector<Digraph::Node> front = centres;
    for (const Digraph::Node centre : centres) {
        seen[centre] = 1;
    }
    for (std::size_t step = 0; step < depth && !front.empty(); ++step) {
        std::vector<Digraph::Node> next;
        for (const Digraph::Node node : front) {
            for (const Digraph::Node target : edges.From(node)) {
                if (seen[target] == 0) {
                    seen[target] = 1;
                    next.push_back(target);
                }
            }
        }
        front = std::move(next);
    }
    for (Digraph::Node node = 0; node < seen.size(); ++node) {
        shown[node] = static_cast<char>(shown[node] | seen[node]);
    }
}

}  // namespace

Shown Everything(const BootGraph& graph) { return Shown(graph.Edges().Size(), 1); }

Shown Neighbourhood(const BootGraph& graph, const std::vector<Digraph::Node>& centres,
                    std::size_t depth) {
    Shown shown(graph.Edges().Size());
    Reach(graph.Edges(), centres, depth, shown);
    Reach(graph.Edges().Reversed(), centres, depth, shown);
    return shown;
}

std::string EscapeLabel(const std::string& text) {
    std::string escaped;
    for (const char c : EscapeQuoted(text)) {
        escaped += c == '&' ? "&amp;" : std::string(1, c);
    }
    return escaped;
}

void WriteDrawing(const BootGraph& graph, const Shown& shown, std::ostream& stream) {
    Drawing(graph, shown, stream).Write();
}

}  // namespace vantor::analyze
