#include "graph/ReadyQueue.h"

#include <utility>

#include "graph/Node.h"

namespace vantor {

void ReadyQueue::Push(Node& node) {
    const std::int32_t height = node.HeightLocked();
    if (height > highestHeight && !Empty()) {
        MakeRow(lower.cbegin(), highestHeight) = std::exchange(highest, Row());
    }
    if (height > highestHeight || Empty()) {
        highestHeight = height;
    }
    Append(height == highestHeight ? highest : LowerRow(height), node);
}

Node& ReadyQueue::TakeHighest(std::size_t position) {
    Node* before = nullptr;
    Node* taken = highest.first;
    for (; position > 0; --position) {
        before = taken;
        taken = taken->nextReady;
    }
    (before == nullptr ? highest.first : before->nextReady) = taken->nextReady;
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

ReadyQueue::Row& ReadyQueue::LowerRow(std::int32_t height) {
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
    node.nextReady = nullptr;
    (row.count == 0 ? row.first : row.last->nextReady) = &node;
    row.last = &node;
    ++row.count;
}

}  // namespace vantor
