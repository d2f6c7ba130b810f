#ifndef VANTOR_ANALYZE_BOOT_CRITICALCHAIN_H
#define VANTOR_ANALYZE_BOOT_CRITICALCHAIN_H

#include <cstddef>
#include <vector>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// What a plugin waited for last before it started.
enum class ReleaseCause {
    Request,  // nothing: it could start when the boot began to run plugins
    Barrier,  // TimelineEntry::releasedBy, through TimelineEntry::releasedThrough
    Worker,   // its barriers were done, and then every worker was busy for a while
};

struct Release {
    ReleaseCause cause = ReleaseCause::Request;
    // The entry whose end it waited for; TimelineEntry::none for a request. For a worker: the one
    // that ended last before the start, whose worker it took over.
    std::size_t by = TimelineEntry::none;
};

// What released each entry; in the order of the entries. n log n.
std::vector<Release> FindReleases(const BootTimeline& timeline);

// A plugin on the critical chain.
struct ChainLink {
    std::size_t entry = 0;
    Release release;
};

// The chain that decided when the boot ended: back from the entry that ended last, each link
// released by the one before it. In the order of time; empty only when no plugin was run.
std::vector<ChainLink> CriticalChain(const BootTimeline& timeline,
                                     const std::vector<Release>& releases);
std::vector<ChainLink> CriticalChain(const BootTimeline& timeline);

}  // namespace vantor::analyze

#endif
