#include "model/BootModel.h"

namespace vantor::analyze {

namespace {

void Note(std::vector<std::size_t>& plugins, std::size_t plugin) {
    if (plugins.empty() || plugins.back() != plugin) {
        plugins.push_back(plugin);
    }
}

}  // namespace

void BootModel::LinkBarriers() {
    barriers.clear();
    for (std::size_t plugin = 0; plugin < plugins.size(); ++plugin) {
        for (const BarrierName& barrier : plugins[plugin].provided) {
            Note(barriers[barrier.name].providers, plugin);
        }
        for (const BarrierName& barrier : plugins[plugin].required) {
            Note(barriers[barrier.name].requirers, plugin);
        }
    }
}

}  // namespace vantor::analyze
