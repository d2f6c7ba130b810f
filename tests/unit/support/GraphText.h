#ifndef VANTOR_SUPPORT_GRAPHTEXT_H
#define VANTOR_SUPPORT_GRAPHTEXT_H

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "graph/Executor.h"
#include "graph/InitBarrier.h"
#include "graph/Node.h"

namespace vantor::support {

// The names of what ran, in the order in which the runs began. May be told by any thread.
class RunOrder {
public:
    void Add(const std::string& name);
    std::vector<std::string> Names() const;

private:
    mutable std::mutex mutex;
    std::vector<std::string> names;
};

// A node that stands for a plugin: running it notes its name, then does what the test asked for.
class TestNode : public Node {
public:
    // `runOrder` outlives the node.
    TestNode(const std::string& nodeName, RunOrder& runOrder) : Node(nodeName), order(runOrder) {}

    void Run() override;
    std::string DotAttributes() const override { return ""; }

    std::function<void()> onRun;  // called by the worker; set it before the node is scheduled

private:
    RunOrder& order;
};

// Does a worker's part for a node that it has taken from the queue.
void Execute(Node& node, Executor& executor);

// Fails the current test unless every edge of the node stands as often in the list of its other
// end. Takes GlobalLock.
void ExpectEdgesAgree(const Node& node);

// A graph written as a few lines, for tests:
//
//   GraphText graph({"a provides x", "b requires x provides y z", "c"});
//
// makes the plugins a, b and c, in the order of their first mention, and links each as a plugin
// links itself while it is constructed. A name after a verb is a barrier's. Barriers live until the
// process ends, so those of one GraphText have a prefix of their own; BarrierName() has the whole
// name. Building the graph checks that both directions of every edge agree and are what the lines
// say. Destroy it after every executor that ran its nodes.
class GraphText {
public:
    // Throws std::invalid_argument for a line that cannot be read.
    GraphText(std::initializer_list<const char*> lines);

    // The plugin of that name. Throws std::out_of_range when no line mentioned it.
    TestNode& operator[](const std::string& plugin);

    InitBarrier& Barrier(const std::string& name) const;
    std::string BarrierName(const std::string& name) const { return prefix + name; }

    // Requests every plugin, in the order of first mention. With the lock held all the while no
    // worker chooses before all have been requested, so that the order of one worker is certain.
    void Schedule(Executor& executor);
    void WaitDone();

    // A whole run as the driver makes it; returns the names of the plugins that ran, in order.
    std::vector<std::string> Run(std::int32_t workers, bool randomize = false);

    // The plugins that have run so far.
    std::vector<std::string> Order() const { return order.Names(); }

private:
    struct Edges {
        std::vector<const Node*> dependencies;
        std::vector<const Node*> dependents;
    };

    TestNode& Plugin(const std::string& name);
    void AddLine(const std::string& line);
    void CheckEdges() const;

    std::string prefix;
    RunOrder order;
    std::vector<std::unique_ptr<TestNode>> plugins;  // by first mention
    std::map<const Node*, Edges> written;            // what the lines say
};

}  // namespace vantor::support

#endif
