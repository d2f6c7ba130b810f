#ifndef VANTOR_GRAPH_EXECUTOR_H
#define VANTOR_GRAPH_EXECUTOR_H

#include <pthread.h>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

#include "graph/GlobalLock.h"
#include "graph/ReadyQueue.h"

namespace vantor {

class Node;

// Runs the dependency graph on a fixed pool of threads. Of the ready nodes the one with the longest
// chain of work below it (its height) goes first, so that the critical path starts early; among
// equals the one that has been ready longest, or a random one. One worker gives serial order.
//
// A run: construct the executor, Node::RunAll() the plugins in load order, destroy the executor.
// `threads` belongs to the thread that constructs and destroys the executor; the fields that change
// otherwise are guarded by GlobalLock.
class Executor {
public:
    // Starts `threadCount` workers; none when it is below 1, and then no node is ever run. With
    // `randomizeEquals`, equals are drawn by rand(), which nothing seeds: every run draws the same.
    // Throws Exception, with no worker left behind, when the pool cannot be built whole.
    Executor(std::int32_t threadCount, bool randomizeEquals);

    Executor(const Executor&) = delete;
    Executor& operator=(const Executor&) = delete;

    // Lets every worker finish the node that it runs, and joins it. Nodes still in the queue are
    // never run.
    virtual ~Executor();

    // Puts a node that has become ready into the queue. Every worker that sleeps is to be woken for
    // it: from now on that is owed. Only for Node, which holds GlobalLock and has set the node's
    // state; the node must live until it is done or the executor is gone.
    void Enqueue(Node& node);

    // Whether it is owed to the workers that sleep to wake them. Who is told so, and nobody after
    // it, is to call WakeWorkers(): best without the lock, which they want at once. The caller
    // holds GlobalLock.
    bool TakeWakeUp() { return std::exchange(wakeUpOwed, false); }
    void WakeWorkers() { GlobalLock::Broadcast(workAvailable); }

    // Which node to run next: its position among the highest of the queue, counted from 0 in the
    // order in which they became ready. The caller holds GlobalLock, and the queue is not empty.
    std::size_t PickNext() const;

    // Whether a node is ready, and the one to run next, taken out of the queue, which is not empty.
    // For the workers, and for whoever takes their place in an executor without any. The caller
    // holds GlobalLock.
    bool HasReady() const { return !queue.Empty(); }
    Node& TakeNext() { return queue.TakeHighest(PickNext()); }

private:
    using Clock = std::chrono::steady_clock;

    static void* WorkerEntry(void* argument);
    void RunWorker();
    void RunReadyNodes(GlobalLockGuard& guard);
    void LookOutForNodes(GlobalLockGuard& guard);
    void StartWorkers(std::int32_t threadCount);
    void StopWorkers();

    // What idle workers sleep on: broadcast when a node has been queued, if one may sleep, and when
    // the pool stops.
    pthread_cond_t workAvailable;
    ReadyQueue queue;
    std::vector<pthread_t> threads;
    bool stopping = false;
    // Whether a worker has gone to sleep since a node was queued last: if none has, nobody would
    // hear another broadcast. A whole boot is mostly requested before the first worker has the
    // lock.
    bool someSleep = false;
    bool wakeUpOwed = false;
    Clock::time_point lastFellAsleep;  // when a worker went to sleep last
    // Whether the last node for which a worker had to wake others came soon after one of them had
    // gone to sleep. How long those take to wake does not count: that may be many times as long.
    // Nodes are taken to come soon until one has not, as the first ones follow the construction, or
    // a worker has been busy for long.
    bool nodesComeSoon = true;
    bool randomize;
};

}  // namespace vantor

#endif
