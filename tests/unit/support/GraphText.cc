#include "support/GraphText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <stdexcept>

#include "graph/GlobalLock.h"

namespace vantor::support {

namespace {

// A prefix that no other graph of this process has.
std::string NewPrefix() {
    static int graphs = 0;
    return "g" + std::to_string(++graphs) + ".";
}

std::vector<const Node*> Pointers(const Node::Edges& nodes) { return {nodes.begin(), nodes.end()}; }

auto Count(const Node::Edges& nodes, const Node& node) {
    return std::count(nodes.begin(), nodes.end(), &node);
}

}  // namespace

void RunOrder::Add(const std::string& name) {
    const std::lock_guard<std::mutex> guard(mutex);
    names.push_back(name);
}

std::vector<std::string> RunOrder::Names() const {
    const std::lock_guard<std::mutex> guard(mutex);
    return names;
}

void TestNode::Run() {
    order.Add(Name());
    if (onRun) {
        onRun();
    }
}

void Execute(Node& node, Executor& executor) {
    GlobalLockGuard guard;
    node.Execute(executor, guard);
}

void ExpectEdgesAgree(const Node& node) {
    const GlobalLockGuard guard;
    for (const Node* dependency : node.Dependencies()) {
        EXPECT_EQ(Count(node.Dependencies(), *dependency), Count(dependency->Dependents(), node))
            << node.Name() << " depends on " << dependency->Name();
    }
    for (const Node* dependent : node.Dependents()) {
        EXPECT_EQ(Count(node.Dependents(), *dependent), Count(dependent->Dependencies(), node))
            << dependent->Name() << " depends on " << node.Name();
    }
}

GraphText::GraphText(std::initializer_list<const char*> lines) : prefix(NewPrefix()) {
    for (const char* line : lines) {
        AddLine(line);
    }
    CheckEdges();
}

TestNode& GraphText::operator[](const std::string& plugin) {
    for (const auto& known : plugins) {
        if (known->Name() == plugin) {
            return *known;
        }
    }
    throw std::out_of_range("no line mentions the plugin " + plugin);
}

InitBarrier& GraphText::Barrier(const std::string& name) const {
    return *InitBarrier::Get(BarrierName(name));
}

TestNode& GraphText::Plugin(const std::string& name) {
    for (const auto& known : plugins) {
        if (known->Name() == name) {
            return *known;
        }
    }
    plugins.push_back(std::make_unique<TestNode>(name, order));
    written[plugins.back().get()];
    return *plugins.back();
}

void GraphText::AddLine(const std::string& line) {
    std::istringstream words(line);
    std::string word;
    if (!(words >> word)) {
        throw std::invalid_argument("a line without a plugin");
    }
    TestNode& plugin = Plugin(word);
    std::string verb;
    while (words >> word) {
        if (word == "provides" || word == "requires") {
            verb = word;
            continue;
        }
        InitBarrier& barrier = Barrier(word);
        if (verb == "provides") {
            plugin.AddDependent(barrier);
            written[&plugin].dependents.push_back(&barrier);
            written[&barrier].dependencies.push_back(&plugin);
        } else if (verb == "requires") {
            plugin.AddDependency(barrier);
            written[&plugin].dependencies.push_back(&barrier);
            written[&barrier].dependents.push_back(&plugin);
        } else {
            throw std::invalid_argument("no verb before " + word + " in: " + line);
        }
    }
}

void GraphText::CheckEdges() const {
    const GlobalLockGuard guard;
    for (const auto& [node, edges] : written) {
        EXPECT_EQ(Pointers(node->Dependencies()), edges.dependencies) << node->Name();
        EXPECT_EQ(Pointers(node->Dependents()), edges.dependents) << node->Name();
        ExpectEdgesAgree(*node);
    }
}

void GraphText::Schedule(Executor& executor) {
    const GlobalLockGuard guard;
    for (const auto& plugin : plugins) {
        plugin->Schedule(executor);
    }
}

void GraphText::WaitDone() {
    for (const auto& plugin : plugins) {
        plugin->WaitDone();
    }
}

std::vector<std::string> GraphText::Run(std::int32_t workers, bool randomize) {
    Executor executor(workers, randomize);
    Schedule(executor);
    WaitDone();
    return Order();
}

}  // namespace vantor::support
