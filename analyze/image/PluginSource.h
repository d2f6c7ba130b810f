#ifndef VANTOR_ANALYZE_IMAGE_PLUGINSOURCE_H
#define VANTOR_ANALYZE_IMAGE_PLUGINSOURCE_H

#include <cstdint>
#include <string>
#include <utility>

#include "image/Linkage.h"
#include "model/BootModel.h"

namespace vantor::analyze {

// A file of the plugin directory.
struct PluginSource {
    Place place;           // as findings name it
    std::string bootPath;  // as the boot's messages name it
    // Device and inode: files of one number are one object to the linker. Zeros: not known.
    std::pair<std::uint64_t, std::uint64_t> file = {0, 0};
};

// A part of a plugin that the linker looks up by name in all loaded objects.
struct SharedPart {
    std::string what;  // as a sentence names it: "the start entry"
    SymbolName symbol;
};

}  // namespace vantor::analyze

#endif
