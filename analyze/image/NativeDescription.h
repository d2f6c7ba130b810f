#ifndef VANTOR_ANALYZE_IMAGE_NATIVEDESCRIPTION_H
#define VANTOR_ANALYZE_IMAGE_NATIVEDESCRIPTION_H

#include <optional>
#include <string>
#include <vector>

#include "image/Architecture.h"
#include "image/PluginSource.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

class LinkScope;

// What the ELF file of a native plugin says.
struct NativeReading {
    PluginDescription plugin;  // without a name and a fate
    std::vector<SharedPart> sharedParts;
    std::size_t opened = 0;  // its number in the scope
};

// Reads a shared object's `operations` and `metadata` (vantor/plugin.h), of any version, without
// loading it. `boot` is the architecture that the boot is of. What the boot would reject, and what
// it could not survive, is told in `findings` and gives no reading. Of what only loading can tell
// `findings` says so, and the reading is without it. An object that the linker
// opens, as far as this file tells, is told to `scope`, which may be null.
std::optional<NativeReading> ReadNative(const std::string& content, const Architecture& boot,
                                        const PluginSource& source, Findings& findings,
                                        LinkScope* scope = nullptr);

}  // namespace vantor::analyze

#endif
