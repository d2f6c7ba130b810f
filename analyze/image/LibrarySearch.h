#ifndef VANTOR_ANALYZE_IMAGE_LIBRARYSEARCH_H
#define VANTOR_ANALYZE_IMAGE_LIBRARYSEARCH_H

#include <string>
#include <vector>

#include "image/Architecture.h"
#include "image/HostImage.h"
#include "image/Linkage.h"
#include "image/LinkerCache.h"

namespace vantor::analyze {

// Finds libraries where the dynamic linker of a host does (ld.so(8)): in the folders that an object
// names itself, in the linker's cache, and in the default folders of Debian's C library. At boot no
// environment names others.
class LibrarySearch {
public:
    // The image outlives this object.
    LibrarySearch(const HostImage& hostImage, const Architecture& bootArchitecture);

    // The path on the host of the library that an object at `path` needs by a name; empty when the
    // linker finds none of its architecture.
    std::string Find(const std::string& name, const std::string& path,
                     const Linkage& linkage) const;

    // What the boot program itself says of where to look holds for all it loads.
    void SetInheritedPath(const std::string& programsPath) { inherited = programsPath; }

private:
    bool IsLibrary(const std::string& path) const;
    std::string FindIn(const std::string& searchPath, const std::string& name,
                       const std::string& objectPath) const;

    const HostImage& image;
    const Architecture boot;
    const LinkerCache cache;
    std::string defaultFolders;
    std::string libraryFolder;  // what $LIB stands for
    std::string inherited;
};

}  // namespace vantor::analyze

#endif
