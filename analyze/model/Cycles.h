#ifndef VANTOR_ANALYZE_MODEL_CYCLES_H
#define VANTOR_ANALYZE_MODEL_CYCLES_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "model/BootGraph.h"

namespace vantor::analyze {

// A group of plugins that wait for each other in a ring, or in several that share plugins: a
// strongly connected component of the graph. `ring` is a shortest of its cycles: plugins and
// barriers in turn, each waited for by the next and the last by the first, which is the plugin of
// the lowest number. Among several of that length it is the one that begins with the lowest number.
struct Cycle {
    std::vector<Digraph::Node> ring;
    std::size_t plugins = 0;  // in the whole group
    bool isShortest = true;   // false: the search was ended before all of the group was looked at
};

// How many edges FindCycles() follows in all of its searches for shortest cycles before it contents
// itself with the ones it has.
constexpr std::uint64_t cycleSearchLimit = 200'000'000;

// One cycle for each group, in the order of their first plugins. Finding the groups takes linear
// time; a search for the shortest cycle looks no further than the length of the best one so far,
// and not again at plugins that are on no cycle but those already seen.
std::vector<Cycle> FindCycles(const BootGraph& graph, std::uint64_t limit = cycleSearchLimit);

}  // namespace vantor::analyze

#endif
