#ifndef VANTOR_ANALYZE_IMAGE_SHAREDNAMES_H
#define VANTOR_ANALYZE_IMAGE_SHAREDNAMES_H

#include <cstddef>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "image/LinkScope.h"
#include "image/NativeDescription.h"
#include "model/Finding.h"

namespace vantor::analyze {

// The names that the native plugins of a boot export. All of them are visible to all, so of two
// with one name the one that is loaded first serves both; and which that is depends on the order in
// which the directory happens to be listed. The boot program and its libraries are loaded before
// all of them.
class SharedNames {
public:
    // To be called for every native plugin that a boot keeps loaded.
    void Add(const NativeReading& reading);

    // Of a plugin that the boot does not keep after all.
    void Forget(const std::set<std::string>& paths);

    // Tells, of each part that a plugin reaches through an exported name, who else exports it.
    void Report(const LinkScope& scope, Findings& findings) const;

private:
    struct Object {
        Place place;
        std::vector<SharedPart> parts;
        std::vector<std::string> exports;
    };

    using Exporters = std::vector<std::size_t>;  // objects, ascending

    // By the symbols that parts are looked up by.
    std::unordered_map<std::string, Exporters> FindExporters() const;
    // Their paths in a sentence, without that of one object.
    std::string Others(const Exporters& exporters, std::size_t object) const;

    std::vector<Object> objects;
};

}  // namespace vantor::analyze

#endif
