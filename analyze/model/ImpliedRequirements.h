#ifndef VANTOR_ANALYZE_MODEL_IMPLIEDREQUIREMENTS_H
#define VANTOR_ANALYZE_MODEL_IMPLIEDREQUIREMENTS_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "model/BootGraph.h"

namespace vantor::analyze {

// A requirement that could be left out: whatever the plugin waits for is done by the time that
// another barrier it requires is.
struct ImpliedRequirement {
    std::size_t plugin = 0;
    std::string barrier;
    std::string impliedBy;
};

struct ImpliedRequirements {
    std::vector<ImpliedRequirement> found;  // by plugin, then by the bytes of the barrier
    // The first barrier that was not looked for any more; empty when all were.
    std::string endedAt;
};

// How many machine words FindImpliedRequirements() handles before it ends.
constexpr std::uint64_t impliedSearchLimit = 2'000'000'000;

// Finds them all. What a barrier waits for counts only as far as it holds for every boot: through
// plugins that no flag, no earlier run and no list keeps from running. Plugins on cycles are left
// out. Takes time in proportion to edges times barriers / 64, and memory in proportion to nodes.
// `scope` of the graph: GraphScope::All.
ImpliedRequirements FindImpliedRequirements(const BootGraph& graph,
                                            std::uint64_t limit = impliedSearchLimit);

}  // namespace vantor::analyze

#endif
