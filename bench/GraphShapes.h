#ifndef VANTOR_BENCH_GRAPHSHAPES_H
#define VANTOR_BENCH_GRAPHSHAPES_H

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace vantor::bench {

// Nodes 0 to count - 1, and edges from a node to one that waits for it, always a higher one.
struct GraphShape {
    std::size_t count = 0;
    std::vector<std::pair<std::size_t, std::size_t>> edges;
};

//   independent   no edges
//   layered       twenty nodes, a barrier that waits for them all, twenty that wait for it, ...
//   chain         each node waits for the one before it
// Throws std::invalid_argument for any other kind.
GraphShape MakeShape(const std::string& kind, std::size_t count);

}  // namespace vantor::bench

#endif
