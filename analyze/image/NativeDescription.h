#ifndef VANTOR_ANALYZE_IMAGE_NATIVEDESCRIPTION_H
#define VANTOR_ANALYZE_IMAGE_NATIVEDESCRIPTION_H

#include <optional>
#include <string>
#include <vector>

#include "image/Architecture.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

class LinkScope;

// A part of a plugin that the linker looks up by name in all loaded objects.
struct SharedPart {
    std::string what;    // as a sentence names it: "the start entry"
    std::string symbol;  // by which it is looked up
};

// What the ELF file of a native plugin says.
struct NativeReading {
    PluginDescription plugin;  // without a name and a fate
    std::vector<SharedPart> sharedParts;
    std::vector<std::string> exports;  // the symbols that others find in it
};

// A file of the plugin directory.
struct PluginSource {
    Place place;           // as findings name it
    std::string bootPath;  // as the boot's messages name it
};

// Reads a shared object's `operations` and `metadata` (vantor/plugin.h), of any version, without
// loading it. `boot` is the architecture that the boot is of. What the boot would reject, and what
// it could not survive, is told in `findings` and gives no reading. An object that the linker
// opens, as far as this file tells, is told to `scope`, which may be null.
std::optional<NativeReading> ReadNative(const std::string& content, const Architecture& boot,
                                        const PluginSource& source, Findings& findings,
                                        LinkScope* scope = nullptr);

}  // namespace vantor::analyze

#endif
