#include "graph/Node.h"

#include <algorithm>
#include <utility>
#include <vector>

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
    if (state == NodeState::Idle) {
        Request(executor);
    } else if (state == NodeState::Waiting) {
        QueueIfReady(executor);
    }
}

// Depth first, in the order of the lists: a dependency that nobody has requested yet is requested,
// with all that it waits for, before the next one is looked at.
void Node::Request(Executor& executor) {
    std::vector<Node*> requesters;
    Node* node = this;
    node->BecomeWaiting();
    for (;;) {
        if (Node* const idle = node->NextIdleDependency()) {
            requesters.push_back(node);
            node = idle;
            node->BecomeWaiting();
            continue;
        }
        node->firstUndone = node->dependencies.cbegin();
        node->QueueIfReady(executor);
        if (requesters.empty()) {
            return;
        }
        node = requesters.back();
        requesters.pop_back();
    }
}

void Node::BecomeWaiting() {
    state = NodeState::Waiting;
    firstUndone = dependencies.cbegin();
}

Node* Node::NextIdleDependency() {
    while (firstUndone != dependencies.cend()) {
        Node* const dependency = *firstUndone++;
        if (dependency->state == NodeState::Idle) {
            return dependency;
        }
    }
    return nullptr;
}

// A dependency that is done stays so: none is looked at again.
void Node::QueueIfReady(Executor& executor) {
    while (firstUndone != dependencies.cend() && (*firstUndone)->state == NodeState::Done) {
        ++firstUndone;
    }
    if (firstUndone == dependencies.cend()) {
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
            dependent->QueueIfReady(executor);
        }
    }
    GlobalLock::Broadcast(doneCondition);
}

void Node::WaitDone() {
    const GlobalLockGuard guard;
    WaitDoneLocked();
}

void Node::WaitDoneLocked() {
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
    return HeightLocked();
}

std::int32_t Node::HeightLocked() {
    if (!heightKnown) {
        ComputeHeight();
    }
    return height;
}

// Depth first. While a node is under way its height is that of the highest dependent seen so far,
// and 0 before there is one; a dependent that is under way itself closes a cycle.
void Node::ComputeHeight() {
    struct Visit {
        Node* node;
        Edges::const_iterator next;  // the dependent to look at
    };
    std::vector<Visit> path;
    height = 0;
    Visit visit{this, dependents.cbegin()};
    for (;;) {
        const Edges& edges = visit.node->dependents;
        while (visit.next != edges.cend() && (*visit.next)->height >= 0) {
            if ((*visit.next)->heightKnown) {
                visit.node->height = std::max(visit.node->height, (*visit.next)->height);
            }
            ++visit.next;
        }
        if (visit.next != edges.cend()) {
            path.push_back(visit);
            Node* const unknown = *visit.next;
            unknown->height = 0;
            visit = {unknown, unknown->dependents.cbegin()};
            continue;
        }
        ++visit.node->height;
        visit.node->heightKnown = true;
        if (path.empty()) {
            return;
        }
        visit = path.back();
        path.pop_back();
    }
}

}  // namespace vantor
