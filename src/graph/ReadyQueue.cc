#include "graph/ReadyQueue.h"

#include <utility>

#include "graph/Node.h"

namespace vantor {

void ReadyQueue::Push(Node& node) {
    const std::int32_t height = node.HeightLocked();
    auto found = rows.lower_bound(height);
    if (found == rows.end() || found->first != height) {
        if (spare.empty()) {
            found = rows.emplace_hint(found, height, Row());
        } else {
            spare.key() = height;
            spare.mapped() = Row();
            found = rows.insert(found, std::move(spare));
        }
    }
    Row& row = found->second;
    node.nextReady = nullptr;
    if (row.last == nullptr) {
        row.first = &node;
    } else {
        row.last->nextReady = &node;
    }
    row.last = &node;
    ++row.count;
}

Node& ReadyQueue::TakeHighest(std::size_t position) {
    Row& row = rows.begin()->second;
    Node* before = nullptr;
    Node* taken = row.first;
    for (; position > 0; --position) {
        before = taken;
        taken = taken->nextReady;
    }
    (before == nullptr ? row.first : before->nextReady) = taken->nextReady;
    if (taken == row.last) {
        row.last = before;
    }
    if (--row.count == 0) {
        spare = rows.extract(rows.begin());
    }
    return *taken;
}

}  // namespace vantor
