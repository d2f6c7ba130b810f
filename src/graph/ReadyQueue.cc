#include "graph/ReadyQueue.h"

#include <utility>

#include "graph/Node.h"

namespace vantor {

// A node that is alone is the one to take, however high it is; and nodes that the same ones wait
// for are equally high, however high that is. In a chain of plugins, and in layers of them with a
// barrier between any two, no height is ever computed.
void ReadyQueue::Push(Node& node) {
    if (Empty()) {
        highestHeight = 0;
        Append(highest, node);
        return;
    }
    if (highestHeight == 0) {
        if (node.dependents == highest.first->dependents) {
            Append(highest, node);
            return;
        }
        highestHeight = highest.first->HeightLocked();
    }
    const std::int32_t height = node.HeightLocked();
    Append(height == highestHeight ? highest : RowOfOtherHeight(height), node);
}

Node& ReadyQueue::TakeHighest(std::size_t position) {
    Node* before = nullptr;
    Node* taken = highest.first;
    for (; position > 0; --position) {
        before = taken;
        taken = taken->next;
    }
    (before == nullptr ? highest.first : before->next) = taken->next;
    if (taken == highest.last) {
        highest.last = before;
    }
    --highest.count;
    if (highest.count == 0 && !lower.empty()) {
        spare = lower.extract(lower.cbegin());
        highestHeight = spare.key();
        highest = spare.mapped();
    }
    return *taken;
}

ReadyQueue::Row& ReadyQueue::RowOfOtherHeight(std::int32_t height) {
    if (height > highestHeight) {
        MakeRow(lower.cbegin(), highestHeight) = std::exchange(highest, Row());
        highestHeight = height;
        return highest;
    }
    const auto found = lower.lower_bound(height);
    return found != lower.end() && found->first == height ? found->second : MakeRow(found, height);
}

ReadyQueue::Row& ReadyQueue::MakeRow(Rows::const_iterator before, std::int32_t height) {
    if (spare.empty()) {
        return lower.emplace_hint(before, height, Row())->second;
    }
    spare.key() = height;
    spare.mapped() = Row();
    return lower.insert(before, std::move(spare))->second;
}

void ReadyQueue::Append(Row& row, Node& node) {
    node.next = nullptr;
    (row.count == 0 ? row.first : row.last->next) = &node;
    row.last = &node;
    ++row.count;
}

}  // namespace vantor
