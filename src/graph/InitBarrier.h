#ifndef VANTOR_GRAPH_INITBARRIER_H
#define VANTOR_GRAPH_INITBARRIER_H

#include <boost/intrusive/set_hook.hpp>
#include <list>
#include <string>

#include "graph/Node.h"

namespace vantor {

// A barrier's place in the registry of all barriers.
using RegistryHook =
    boost::intrusive::set_base_hook<boost::intrusive::link_mode<boost::intrusive::normal_link>,
                                    boost::intrusive::optimize_size<true>>;

// A named initialisation barrier: the point in a boot at which every plugin that provides the name
// has finished. Plugins know barriers, never each other. Barriers are created on first mention,
// owned by nobody and live until the process ends.
class InitBarrier : public Node, public RegistryHook {
public:
    // The barrier of that name, created if this is its first mention; the same object every time.
    // Names are compared byte by byte. Takes GlobalLock.
    static InitBarrier* Get(const std::string& barrierName);

    // All barriers, ascending by name. Takes GlobalLock.
    static std::list<InitBarrier*> All();

    // Raises a system alert that names the plugins that wait for the barrier when no plugin
    // provides it; in invoke mode, where most plugins are not loaded, it stays silent. The waiting
    // plugins run either way.
    void Run() override;

    std::string DotAttributes() const override;

    bool RunsUnderLock() const override { return true; }

private:
    explicit InitBarrier(const std::string& barrierName);

    std::string MissingProviderText() const;
};

}  // namespace vantor

#endif
