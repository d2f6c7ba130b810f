#ifndef VANTOR_ANALYZE_IMAGE_DEBUGDESCRIPTION_H
#define VANTOR_ANALYZE_IMAGE_DEBUGDESCRIPTION_H

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "driver/DebugConfig.h"
#include "image/HostImage.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// The debug entries of a host. A boot makes a plugin of each of them, behind those of the plugin
// directory, and one more for each marker file (<name>.debug) of its name there.
class DebugDescription {
public:
    // Reads the debug configuration. Its malformed lines are told in `findings`.
    DebugDescription(const HostImage& image, Findings& findings);

    // The plugins that a marker file brings, in the order of the lines. Tells of a marker that
    // brings none, and remembers the entries of one that does.
    std::vector<PluginDescription> OfMarker(const std::string& name, const Place& marker,
                                            Findings& findings);

    // The plugins that the configuration brings by itself. Tells of those that a marker has
    // brought as well.
    std::vector<PluginDescription> OfConfiguration(Findings& findings) const;

private:
    struct Entry {
        DebugEntry entry;
        std::vector<std::string> markers;  // the paths of those that bring it too
    };

    static PluginDescription Describe(const DebugEntry& entry);

    std::vector<Entry> entries;  // in the order of the lines
    std::map<std::string, std::vector<std::size_t>> byName;
};

}  // namespace vantor::analyze

#endif
