#ifndef VANTOR_GRAPH_NODE_H
#define VANTOR_GRAPH_NODE_H

#include <pthread.h>

#include <atomic>
#include <boost/container/small_vector.hpp>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <string>

#include "graph/GlobalLock.h"

namespace vantor {

class Executor;

// How far a node has come. It only ever moves downwards in this list.
enum class NodeState : std::int32_t {
    Idle = 0,     // constructed, not yet requested
    Waiting = 1,  // requested; at least one dependency is not done
    Queued = 2,   // in the executor's ready queue, or running
    Done = 3,     // finished, or declared finished without running
};

// A node of the process-wide dependency graph: a plugin, or a barrier between plugins. An edge
// stands in the lists of both its ends; the lists do not own the nodes.
//
//   Idle --Schedule--> Waiting --Schedule, all dependencies done--> Queued --Execute--> Done
//   Idle --Schedule, all dependencies done--> Queued
//   Idle --MarkDone--> Done
//
// There is no way back and no state for failure: what became of a plugin's method is the plugin's
// own record. All state and both lists are guarded by GlobalLock, which every operation takes
// itself unless it says otherwise; calling them with the lock held is allowed. Edges are added only
// before any worker exists. Nothing looks for cycles: a node on one is never run. No operation
// recurses, so that a chain may be as long as memory allows.
class Node {
public:
    // The neighbours on one side, in the order in which the edges were added. Nearly every node has
    // one at most, which then takes neither an allocation nor another place in memory.
    using Edges = boost::container::small_vector<Node*, 1>;

    // Throws Exception when the condition variable cannot be initialised.
    explicit Node(std::string nodeName);

    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    // Does the node's work. Called by a worker thread, without the lock. Must not throw.
    virtual void Run() = 0;

    // What the drawn graph says about the node after its label; empty, or starting with a blank.
    virtual std::string DotAttributes() const = 0;

    // Takes the node out of the lists of its neighbours, so that a plugin whose construction fails
    // half-way leaves no pointer to itself behind.
    virtual ~Node();

    // Whether Run() holds the lock from its beginning to its end. No worker could choose a node
    // meanwhile: those that sleep are woken after it, together with what it makes ready.
    virtual bool RunsUnderLock() const { return false; }

    const std::string& Name() const { return name; }

    // These take no lock: who walks a list holds it.
    const Edges& Dependencies() const { return dependencies; }
    const Edges& Dependents() const { return dependents; }

    NodeState State() const;

    // This node waits for `other`. The same edge may be added more than once and is then kept more
    // than once. Neither pointer is owned.
    void AddDependency(Node& other);

    // `other` waits for this node.
    void AddDependent(Node& other);

    // Requests that the node run: it is queued at once when all its dependencies are done;
    // otherwise they are requested too and the last of them to finish queues it. Does nothing for a
    // node that is queued or done.
    void Schedule(Executor& executor);

    // Runs the node, marks it done and queues the requested dependents that were waiting for it
    // alone. Called by a worker that took the node from the queue. Its guard holds the lock, gives
    // it up while the node runs and holds it again on return: the lock is taken once for the end of
    // a node and the choice of the next.
    void Execute(Executor& executor, GlobalLockGuard& guard);

    // Blocks until the node is done.
    void WaitDone();

    // Requests every node of a sequence of pointers, in its order, and blocks until all are done.
    // No worker chooses before all are requested. The calling thread must not hold the lock.
    template <typename Nodes>
    static void RunAll(const Nodes& nodes, Executor& executor) {
        GlobalLockGuard guard;
        for (Node* node : nodes) {
            node->ScheduleLocked(executor);
        }
        ReleaseAndWake(guard, executor);
        if (AnyUnfinished()) {
            LookOutForTheEnd();
        }
        guard.Retake();
        // What is requested last is mostly done last: from that end few nodes are found undone, and
        // this thread is seldom woken to take the lock from the workers.
        for (auto node = std::rbegin(nodes); node != std::rend(nodes) && AnyUnfinished(); ++node) {
            (*node)->WaitDoneLocked();
        }
    }

    // Declares the node finished without running it. Wakes nobody and looks at no dependent: for
    // use before execution starts.
    void MarkDone();

    // Number of nodes on the longest chain that starts here and follows dependents: 1 for a node
    // that none waits for. Computed once and kept, so no edge may be added below this node after
    // the first call. Where the chains lead into a cycle, the edges that close it are left out.
    std::int32_t Height();

private:
    // Chains the nodes that are ready through `next`, and sees which the same ones wait for.
    friend class ReadyQueue;

    // These take no lock and need none.
    static bool AnyUnfinished() { return !allFinished.value.load(std::memory_order_relaxed); }
    static void LookOutForTheEnd();

    // The caller of any of these holds the lock; ReleaseAndWake() gives it up.
    static void CountUnfinished(std::int32_t step);
    void ScheduleLocked(Executor& executor);
    void WaitDoneLocked();
    static void ReleaseAndWake(GlobalLockGuard& guard, Executor& executor);
    std::int32_t HeightLocked() {
        if (!heightKnown) {
            ComputeHeight();
        }
        return height;
    }
    void RequestBelow(Node& firstIdle, Executor& executor);
    void BecomeWaiting();
    void BecomeDone();
    void EndRequest(Executor& executor);
    Node* NextIdleDependency();
    void QueueIfReady(Executor& executor);
    void ComputeHeight();
    Node* NextWithoutHeight();

    // So many nodes have been requested and are neither done nor destroyed, of all executors
    // together; and whether that is none. Both are written with the lock held. LookOutForTheEnd()
    // reads the second one without it, which is therefore atomic, and alone in its cache line: the
    // workers write there once a run and not at each node.
    struct alignas(64) Flag {
        std::atomic<bool> value;
    };
    static std::int32_t unfinished;
    static Flag allFinished;

    bool heightKnown = false;
    std::int32_t height = -1;
    NodeState state = NodeState::Idle;
    bool awaited = false;  // whether a thread has waited for `doneCondition`
    // Of a waiting node: so many of its first dependencies are done. While the node is being
    // requested: so many have been requested.
    std::uint32_t settled = 0;
    // While its height is being found: so many of its dependents have been looked at.
    std::uint32_t heightsSeen = 0;
    Node* next = nullptr;  // once it is queued: the one behind it in its row of the ready queue
    std::string name;
    Edges dependencies;
    Edges dependents;
    Node* heightIsFor = nullptr;  // while its height is being found: the node whose height needs it
    pthread_cond_t doneCondition;  // broadcast when the node becomes done through Execute()
};

}  // namespace vantor

#endif
