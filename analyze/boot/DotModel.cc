#include "boot/DotModel.h"

#include <cerrno>
#include <charconv>
#include <cstdint>
#include <cstring>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string_view>
#include <utility>
#include <vector>

#include "boot/InputText.h"

namespace vantor::analyze {

namespace {

constexpr std::string_view labelStart = " [label=\"";
constexpr std::string_view labelEnd = "\"];";
constexpr std::string_view barrierEnd = "\" shape=box];";
constexpr std::string_view edgeArrow = " -> ";

bool EndsWith(std::string_view text, std::string_view end) {
    return text.size() >= end.size() && text.substr(text.size() - end.size()) == end;
}

class DotReader {
public:
    DotReader(std::istream& source, const std::string& name) : stream(source), path(name) {}

    BootModel Read() {
        std::string line;
        while (!closed && std::getline(stream, line)) {
            ++number;
            Take(line);
        }
        if (stream.bad()) {
            throw std::runtime_error(path + ": cannot be read: " + std::strerror(errno));
        }
        if (!closed) {
            ++number;
            Fail("the drawing ends here, before its \"}\"");
        }
        if (std::getline(stream, line)) {
            ++number;
            Fail("the drawing should end before this line");
        }
        AddEdges();
        model.LinkBarriers();
        return std::move(model);
    }

private:
    struct Statement {
        std::string name;
        bool isBarrier = false;
        std::size_t plugin = 0;  // of the model; of a plugin only
    };
    struct Edge {
        std::uint64_t from;
        std::uint64_t to;
    };

    [[noreturn]] void Fail(const std::string& reason) const {
        throw std::runtime_error(path + ":" + std::to_string(number) + ": " + reason);
    }

    void Take(std::string_view line) {
        if (number == 1) {
            if (line != "digraph g {") {
                Fail("not a drawing of the boot program: it should begin with \"digraph g {\"");
            }
        } else if (line == "}") {
            closed = true;
        } else {
            const std::uint64_t id = TakeId(line);
            if (line.substr(0, edgeArrow.size()) == edgeArrow) {
                line.remove_prefix(edgeArrow.size());
                edges.push_back({id, TakeId(line)});
                if (line != ";") {
                    Fail("expected \";\" and the end of the line after the edge");
                }
                if (statements.count(id) == 0) {
                    Fail("an edge out of a node that no line before it has named");
                }
            } else {
                TakeNode(id, line);
            }
        }
    }

    std::uint64_t TakeId(std::string_view& line) const {
        std::uint64_t id = 0;
        const auto [end, error] = std::from_chars(line.data(), line.data() + line.size(), id);
        if (error != std::errc()) {
            Fail("expected the number of a node");
        }
        line.remove_prefix(static_cast<std::size_t>(end - line.data()));
        return id;
    }

    // A plugin's name may end as a barrier's statement does; then it is read as a barrier's.
    void TakeNode(std::uint64_t id, std::string_view line) {
        Statement node;
        node.isBarrier = EndsWith(line, barrierEnd);
        const std::string_view end = node.isBarrier ? barrierEnd : labelEnd;
        if (line.substr(0, labelStart.size()) != labelStart || !EndsWith(line, end) ||
            line.size() < labelStart.size() + end.size()) {
            Fail("neither a node with its label nor an edge");
        }
        line.remove_prefix(labelStart.size());
        line.remove_suffix(end.size());
        node.name = std::string(line);
        if (!node.isBarrier) {
            node.plugin = model.plugins.size();
            PluginDescription& plugin = model.plugins.emplace_back();
            plugin.name = node.name;
            plugin.place = {path, number, 0};
        }
        if (!statements.emplace(id, std::move(node)).second) {
            Fail("a node that an earlier line has named already");
        }
    }

    void AddEdges() {
        for (const Edge& edge : edges) {
            const auto from = statements.find(edge.from);
            const auto to = statements.find(edge.to);
            if (to == statements.end()) {
                continue;  // a filtered plugin
            }
            if (from->second.isBarrier == to->second.isBarrier) {
                throw std::runtime_error(path + ": an edge from '" + from->second.name + "' to '" +
                                         to->second.name +
                                         "': edges run between a plugin and a barrier");
            }
            if (to->second.isBarrier) {
                model.plugins[from->second.plugin].provided.push_back({to->second.name, {}});
            } else {
                model.plugins[to->second.plugin].required.push_back({from->second.name, {}});
            }
        }
    }

    std::istream& stream;
    const std::string& path;
    int number = 0;
    bool closed = false;
    std::map<std::uint64_t, Statement> statements;
    std::vector<Edge> edges;
    BootModel model;
};

}  // namespace

BootModel ParseDotModel(std::istream& stream, const std::string& path) {
    return DotReader(stream, path).Read();
}

BootModel ReadDotModel(const std::string& path) {
    std::istringstream stream(ReadInput(path));
    return ParseDotModel(stream, path);
}

}  // namespace vantor::analyze
