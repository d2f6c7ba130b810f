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
// The rows are chained through the nodes themselves, which must live as long as they are in it and
// be in no other. Guarded by GlobalLock: whoever calls an operation holds it.
class ReadyQueue {
public:
    bool Empty() const { return highest.count == 0; }

    // Puts a node at the end of the row of its height, which is computed if it is not known yet:
    // not before two nodes in the queue may differ in height. Logarithmic in the number of rows.
    void Push(Node& node);

    // The number of nodes in the highest row. The queue is not empty.
    std::size_t HighestCount() const { return highest.count; }

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

    // The row of another height than the highest one's; a greater one becomes the highest.
    Row& RowOfOtherHeight(std::int32_t height);
    Row& MakeRow(Rows::const_iterator before, std::int32_t height);
    static void Append(Row& row, Node& node);

    // The highest row stands apart: in chains and layers it is the only one.
    std::int32_t highestHeight = 0;  // 0 while nobody has asked for it: there is no other row
    Row highest;                     // empty only when the queue is
    Rows lower;                      // the others, none of them empty
    Rows::node_type spare;  // of the row that left `lower` last, for the next one that comes
};

}  // namespace vantor

#endif
