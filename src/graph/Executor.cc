#include "graph/Executor.h"

#include <sched.h>

#include <chrono>
#include <cstdlib>
#include <memory>
#include <string>

#include "graph/GlobalLock.h"
#include "graph/Node.h"
#include "plugins/Exceptions.h"

namespace vantor {

namespace {

// What a worker is started with; the worker frees it.
struct WorkerStart {
    Executor* executor;
    std::int32_t index;
};

// About as long as falling asleep and being woken take.
constexpr std::chrono::microseconds soon{50};

}  // namespace

Executor::Executor(std::int32_t threadCount, bool randomizeEquals) : randomize(randomizeEquals) {
    if (pthread_cond_init(&workAvailable, nullptr) != 0) {
        throw Exception("Condition variable for Executor could not be initialized");
    }
    try {
        StartWorkers(threadCount);
    } catch (...) {
        StopWorkers();
        pthread_cond_destroy(&workAvailable);
        throw;
    }
}

Executor::~Executor() {
    StopWorkers();
    pthread_cond_destroy(&workAvailable);
}

void Executor::StartWorkers(std::int32_t threadCount) {
    if (threadCount < 1) {
        return;
    }
    threads.reserve(static_cast<std::size_t>(threadCount));
    for (std::int32_t index = 0; index < threadCount; ++index) {
        auto start = std::make_unique<WorkerStart>(WorkerStart{this, index});
        pthread_t thread{};
        if (pthread_create(&thread, nullptr, &Executor::WorkerEntry, start.get()) != 0) {
            throw Exception("Could not create enough execution threads. (" +
                            std::to_string(threads.size()) + " created, " +
                            std::to_string(threadCount) + "requested)");
        }
        static_cast<void>(start.release());  // the worker owns it now
        threads.push_back(thread);
    }
}

// The lock is free while joining: a worker that sleeps on `workAvailable` must take it to leave.
void Executor::StopWorkers() {
    GlobalLockGuard guard;
    stopping = true;
    GlobalLock::Broadcast(workAvailable);
    guard.Release();
    for (const pthread_t thread : threads) {
        pthread_join(thread, nullptr);
    }
    threads.clear();
}

void Executor::Enqueue(Node& node) {
    queue.Push(node);
    wakeUpOwed = wakeUpOwed || someSleep;
    someSleep = false;
}

std::size_t Executor::PickNext() const {
    if (!randomize) {
        return 0;
    }
    return static_cast<std::size_t>(std::rand()) % queue.HighestCount();
}

void* Executor::WorkerEntry(void* argument) {
    {
        const std::unique_ptr<WorkerStart> start(static_cast<WorkerStart*>(argument));
        start->executor->RunWorker();
    }
    pthread_exit(nullptr);
}

void Executor::RunWorker() {
    GlobalLockGuard guard;
    while (!stopping) {
        RunReadyNodes(guard);
        LookOutForNodes(guard);
        if (!HasReady() && !stopping) {
            lastFellAsleep = Clock::now();
            someSleep = true;
            GlobalLock::Wait(workAvailable);
        }
    }
}

// Until none is ready, or the pool stops. Whoever was busy for long is not to look out for more: on
// a machine with other work to do, giving way takes milliseconds.
void Executor::RunReadyNodes(GlobalLockGuard& guard) {
    if (!HasReady()) {
        return;
    }
    const auto begin = Clock::now();
    while (HasReady() && !stopping) {
        TakeNext().Execute(*this, guard);
        if (wakeUpOwed) {
            nodesComeSoon = Clock::now() - lastFellAsleep < soon;
        }
    }
    nodesComeSoon = nodesComeSoon && Clock::now() - begin < soon;
}

// A worker that has just been started looks here for what is requested at that moment, and so need
// not be woken for it. Later, every node that is queued wakes all idle workers, and mostly all but
// one in vain: where one short node follows the other, a worker that went back to sleep at once
// would be there to be woken for the very next one, at many times the cost of the node. So it looks
// again a few times before, and lets others have the processor in between. Where nodes take long,
// that would only take processor time from them.
void Executor::LookOutForNodes(GlobalLockGuard& guard) {
    constexpr int looks = 30;
    for (int i = 0; i < looks && nodesComeSoon && !HasReady() && !stopping; ++i) {
        guard.Release();
        sched_yield();
        guard.Retake();
    }
}

}  // namespace vantor
