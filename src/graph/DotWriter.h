#ifndef VANTOR_GRAPH_DOTWRITER_H
#define VANTOR_GRAPH_DOTWRITER_H

#include <ostream>

namespace vantor {

class Node;

// Writes the node's statement and one edge statement for each of its dependents, in the DOT
// language (https://graphviz.org/doc/info/lang.html), a flushed line each. A node's id is its
// address: it identifies the node within one drawing and means nothing beyond it. Names are written
// as they are. Takes GlobalLock for the edges.
void WriteDot(const Node& node, std::ostream& stream);

}  // namespace vantor

#endif
