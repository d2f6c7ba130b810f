#include "graph/Node.h"

#include <sched.h>

#include <algorithm>
#include <chrono>
#include <utility>
#include <vector>

#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "graph/SpinPause.h"
#include "plugins/Exceptions.h"

namespace vantor {

namespace {

void Remove(Node::Edges& edges, const Node* node) {
    edges.erase(std::remove(edges.begin(), edges.end(), node), edges.end());
}

}  // namespace

std::int32_t Node::unfinished = 0;
Node::Flag Node::allFinished{true};

Node::Node(std::string nodeName) : name(std::move(nodeName)) {
    if (pthread_cond_init(&doneCondition, nullptr) != 0) {
        throw Exception("Condition variable for Node could not be initialized");
    }
}

Node::~Node() {
    const GlobalLockGuard guard;
    BecomeDone();
    for (Node* dependency : dependencies) {
        Remove(dependency->dependents, this);
    }
    for (Node* dependent : dependents) {
        Remove(dependent->dependencies, this);
    }
    pthread_cond_destroy(&doneCondition);
}

NodeState Node::State() const {
    const GlobalLockGuard guard;
    return state;
}

void Node::AddDependency(Node& other) {
    const GlobalLockGuard guard;
    other.dependents.push_back(this);
    dependencies.push_back(&other);
}

void Node::AddDependent(Node& other) {
    const GlobalLockGuard guard;
    dependents.push_back(&other);
    other.dependencies.push_back(this);
}

void Node::Schedule(Executor& executor) {
    GlobalLockGuard guard;
    ScheduleLocked(executor);
    ReleaseAndWake(guard, executor);
}

// A woken worker wants the lock at once: found taken, it would send the worker to sleep again.
void Node::ReleaseAndWake(GlobalLockGuard& guard, Executor& executor) {
    const bool wake = executor.TakeWakeUp();
    guard.Release();
    if (wake) {
        executor.WakeWorkers();
    }
}

void Node::ScheduleLocked(Executor& executor) {
    if (state == NodeState::Idle) {
        BecomeWaiting();
        if (Node* const idle = NextIdleDependency()) {
            RequestBelow(*idle, executor);
        } else {
            EndRequest(executor);
        }
    } else if (state == NodeState::Waiting) {
        QueueIfReady(executor);
    }
}

void Node::CountUnfinished(std::int32_t step) {
    if (unfinished == 0) {
        allFinished.value.store(false, std::memory_order_relaxed);
    }
    unfinished += step;
    if (unfinished == 0) {
        allFinished.value.store(true, std::memory_order_relaxed);
    }
}

// A graph of short nodes is done before this thread would have fallen asleep and been woken. Other
// threads may have the processor meanwhile, a sibling on the same core too. The pause is a short
// one: where the worker shares this processor, it waits for the end of the pause at each of its own
// turns.
void Node::LookOutForTheEnd() {
    using Clock = std::chrono::steady_clock;
    constexpr std::chrono::microseconds patience{200};
    constexpr int pause = 8;
    const auto end = Clock::now() + patience;
    do {
        sched_yield();
        SpinPause(pause);
    } while (AnyUnfinished() && Clock::now() < end);
}

// Depth first, in the order of the lists: a dependency that nobody has requested yet is requested,
// with all that it waits for, before the next one is looked at. This node's own request ends here.
void Node::RequestBelow(Node& firstIdle, Executor& executor) {
    std::vector<Node*> requesting{this};
    for (Node* idle = &firstIdle; !requesting.empty();) {
        if (idle != nullptr) {
            idle->BecomeWaiting();
            requesting.push_back(idle);
        } else {
            requesting.back()->EndRequest(executor);
            requesting.pop_back();
        }
        idle = requesting.empty() ? nullptr : requesting.back()->NextIdleDependency();
    }
}

void Node::BecomeWaiting() {
    CountUnfinished(1);
    state = NodeState::Waiting;
    settled = 0;
}

Node* Node::NextIdleDependency() {
    while (settled != dependencies.size()) {
        Node* const dependency = dependencies[settled++];
        if (dependency->state == NodeState::Idle) {
            return dependency;
        }
    }
    return nullptr;
}

void Node::EndRequest(Executor& executor) {
    settled = 0;
    QueueIfReady(executor);
}

// A dependency that is done stays so: none is looked at again.
void Node::QueueIfReady(Executor& executor) {
    while (settled != dependencies.size() && dependencies[settled]->state == NodeState::Done) {
        ++settled;
    }
    if (settled == dependencies.size()) {
        state = NodeState::Queued;
        executor.Enqueue(*this);
    }
}

void Node::Execute(Executor& executor, GlobalLockGuard& guard) {
    if (RunsUnderLock()) {
        guard.Release();
    } else {
        ReleaseAndWake(guard, executor);
    }
    Run();
    guard.Retake();
    BecomeDone();
    for (Node* dependent : dependents) {
        if (dependent->state == NodeState::Waiting) {
            dependent->QueueIfReady(executor);
        }
    }
    if (awaited) {
        GlobalLock::Broadcast(doneCondition);
    }
}

void Node::WaitDone() {
    const GlobalLockGuard guard;
    WaitDoneLocked();
}

void Node::WaitDoneLocked() {
    while (state != NodeState::Done) {
        awaited = true;
        GlobalLock::Wait(doneCondition);
    }
}

void Node::MarkDone() {
    const GlobalLockGuard guard;
    BecomeDone();
}

void Node::BecomeDone() {
    if (state == NodeState::Waiting || state == NodeState::Queued) {
        CountUnfinished(-1);
    }
    state = NodeState::Done;
}

std::int32_t Node::Height() {
    const GlobalLockGuard guard;
    return HeightLocked();
}

// Depth first. While a node is under way its height is that of the highest dependent seen so far,
// and 0 before there is one; a dependent that is under way itself closes a cycle. The way back lies
// in the nodes: beside them it would be copied again and again while it grows.
void Node::ComputeHeight() {
    height = 0;
    for (Node* node = this; node != nullptr;) {
        if (Node* const unknown = node->NextWithoutHeight()) {
            unknown->height = 0;
            unknown->heightIsFor = node;
            node = unknown;
        } else {
            ++node->height;
            node->heightKnown = true;
            node = node->heightIsFor;
        }
    }
}

Node* Node::NextWithoutHeight() {
    for (; heightsSeen != dependents.size(); ++heightsSeen) {
        Node* const dependent = dependents[heightsSeen];
        if (dependent->height < 0) {
            return dependent;
        }
        if (dependent->heightKnown) {
            height = std::max(height, dependent->height);
        }
    }
    return nullptr;
}

}  // namespace vantor
