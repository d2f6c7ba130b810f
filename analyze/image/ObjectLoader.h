#ifndef VANTOR_ANALYZE_IMAGE_OBJECTLOADER_H
#define VANTOR_ANALYZE_IMAGE_OBJECTLOADER_H

#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "image/HostImage.h"
#include "image/LibrarySearch.h"
#include "image/Linkage.h"

namespace vantor::analyze {

// A program or shared object of a host.
struct Object {
    std::string path;  // as the linker names it
    Linkage linkage;
    std::string unreadable;  // why its file cannot be read here, which root could; then no linkage
};
using ObjectPointer = std::shared_ptr<const Object>;

// The libraries that an object brings with it, in the linker's order.
struct Closure {
    std::vector<ObjectPointer> libraries;
    std::vector<std::string> missing;  // by the names that they are needed by
};

// Reads the files of libraries, each once, and finds what an object brings with it.
class ObjectLoader {
public:
    // The image outlives this object.
    ObjectLoader(const HostImage& hostImage, const Architecture& bootArchitecture);

    // Null where no such object is.
    ObjectPointer Load(const std::string& path);

    // Where the search finds no library of a name, `instead` is asked for one, if it is given.
    using Source = std::function<ObjectPointer(const std::string& name)>;
    Closure Close(const ObjectPointer& root, const Source& instead = {});

    // What the boot program says of where to look holds for all that it loads.
    void SetProgram(const ObjectPointer& program) {
        search.SetProgram(program->path, program->linkage);
    }

    // These are loaded before all others, which so bring nothing that is known by their names.
    void SetLoaded(const std::vector<ObjectPointer>& objects);

    // The files that have been read, but for those that are none.
    std::vector<std::string> Paths() const;

private:
    const HostImage& image;
    LibrarySearch search;
    std::map<std::string, ObjectPointer> objects;  // by path
    std::set<std::string> loadedNames;
};

}  // namespace vantor::analyze

#endif
