#ifndef VANTOR_GRAPH_READYQUEUE_H
#define VANTOR_GRAPH_READYQUEUE_H

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>

namespace vantor {

class Node;

// The nodes that are ready to run, in a row for each height: the highest row is always the one to
// take from, so that a choice costs the same however many nodes wait. Within a row they stand in
// the order in which they became ready.
//
// The rows are chained through the nodes themselves, which must outlive the queue and be in no
// other. Guarded by GlobalLock: whoever calls an operation holds it.
class ReadyQueue {
public:
    bool Empty() const { return rows.empty(); }

    // Puts a node at the end of the row of its height, which is computed if it is not known yet.
    // Logarithmic in the number of rows.
    void Push(Node& node);

    // The number of nodes in the highest row. The queue is not empty.
    std::size_t HighestCount() const { return rows.begin()->second.count; }

    // Removes and returns the node at `position`, counted from 0 for the one that has been ready
    // longest, of the highest row, which has so many. Linear in `position`.
    Node& TakeHighest(std::size_t position);

private:
    struct Row {
        Node* first = nullptr;
        Node* last = nullptr;
        std::size_t count = 0;
    };
    using Rows = std::map<std::int32_t, Row, std::greater<>>;

    Rows rows;              // none of them empty
    Rows::node_type spare;  // of the row that became empty last: a chain needs one at each step
};

}  // namespace vantor

#endif
