#include "graph/Node.h"

#include <algorithm>
#include <utility>

#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "plugins/Exceptions.h"

namespace vantor {

Node::Node(std::string nodeName) : name(std::move(nodeName)) {
    if (pthread_cond_init(&doneCondition, nullptr) != 0) {
        throw Exception("Condition variable for Node could not be initialized");
    }
}

Node::~Node() {
    const GlobalLockGuard guard;
    for (Node* dependency : dependencies) {
        dependency->dependents.remove(this);
    }
    for (Node* dependent : dependents) {
        dependent->dependencies.remove(this);
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
    const GlobalLockGuard guard;
    if (state == NodeState::Queued || state == NodeState::Done) {
        return;
    }
    state = NodeState::Waiting;
    bool ready = true;
    for (Node* dependency : dependencies) {
        if (dependency->state == NodeState::Done) {
            continue;
        }
        if (dependency->state == NodeState::Idle) {
            dependency->Schedule(executor);
        }
        ready = false;
    }
    if (ready) {
        state = NodeState::Queued;
        executor.Enqueue(*this);
    }
}

void Node::Execute(Executor& executor) {
    Run();
    const GlobalLockGuard guard;
    state = NodeState::Done;
    for (Node* dependent : dependents) {
        if (dependent->state == NodeState::Waiting) {
            dependent->Schedule(executor);
        }
    }
    GlobalLock::Broadcast(doneCondition);
}

void Node::WaitDone() {
    const GlobalLockGuard guard;
    while (state != NodeState::Done) {
        GlobalLock::Wait(doneCondition);
    }
}

void Node::MarkDone() {
    const GlobalLockGuard guard;
    state = NodeState::Done;
}

std::int32_t Node::Height() {
    const GlobalLockGuard guard;
    if (!heightKnown) {
        std::int32_t highest = 0;
        for (Node* dependent : dependents) {
            highest = std::max(highest, dependent->Height());
        }
        height = highest + 1;
        heightKnown = true;
    }
    return height;
}

}  // namespace vantor
