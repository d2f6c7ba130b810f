#ifndef VANTOR_ANALYZE_IMAGE_DIRECTORYREADER_H
#define VANTOR_ANALYZE_IMAGE_DIRECTORYREADER_H

#include <list>
#include <set>
#include <string>

#include "image/HostImage.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// What the boot would be told on its command line.
struct BootOptions {
    std::string directory = HostImage::pluginDirectory;  // a path of the host
    std::set<std::string> flags;
    std::list<std::string> disabledPlugins;
    std::set<std::string> runOncePlugins;
};

// Reads every plugin that a boot with these options would, without loading or running any: native
// plugins from their ELF file, documents, and debug entries. What a boot would ignore or reject is
// left out of the model and told in `findings`, in no particular order. Throws std::system_error
// when the directory itself cannot be read, std::runtime_error when it is no path of a host that
// lies in a folder.
BootModel ReadPlugins(const HostImage& image, const BootOptions& options, Findings& findings);

}  // namespace vantor::analyze

#endif
