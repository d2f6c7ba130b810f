#ifndef VANTOR_ANALYZE_IMAGE_SHAREDNAMES_H
#define VANTOR_ANALYZE_IMAGE_SHAREDNAMES_H

#include <string>
#include <vector>

#include "image/NativeDescription.h"
#include "model/Finding.h"

namespace vantor::analyze {

// The names that the native plugins of a boot export. All of them are visible to all, so of two
// with one name the one that is loaded first serves both; and which that is depends on the order in
// which the directory happens to be listed.
class SharedNames {
public:
    // To be called for every native plugin that a boot keeps loaded.
    void Add(const NativeReading& reading);

    // Tells, of each part that a plugin reaches through an exported name, which other plugins
    // export that name too.
    void Report(Findings& findings) const;

private:
    struct Object {
        Place place;
        std::vector<SharedPart> parts;
        std::vector<std::string> exports;
    };

    std::vector<Object> objects;
};

}  // namespace vantor::analyze

#endif
