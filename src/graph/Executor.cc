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

// Every node that is queued wakes all idle workers, and mostly all but one in vain. Where one short
// node follows the other, a worker that went back to sleep at once would be there to be woken for
// the very next one, at many times the cost of the node. So it first lets others have the
// processor, and looks again.
void GiveWay(GlobalLockGuard& guard) {
    constexpr int turns = 3;
    guard.Release();
    for (int i = 0; i < turns; ++i) {
        sched_yield();
    }
    guard.Retake();
}

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
    bool sleptBriefly = false;
    while (!stopping) {
        while (HasReady()) {
            TakeNext().Execute(*this, guard);
            if (stopping) {
                return;
            }
        }
        // After a long sleep nodes come seldom, and giving way only takes processor time from them.
        if (sleptBriefly) {
            GiveWay(guard);
        }
        if (!HasReady() && !stopping) {
            sleptBriefly = SleepUntilWoken();
        }
    }
}

bool Executor::SleepUntilWoken() {
    constexpr std::chrono::microseconds brief{50};
    const auto start = std::chrono::steady_clock::now();
    someSleep = true;
    GlobalLock::Wait(workAvailable);
    return std::chrono::steady_clock::now() - start < brief;
}

}  // namespace vantor
