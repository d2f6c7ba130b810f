#ifndef VANTOR_ANALYZE_IMAGE_LIBRARYSEARCH_H
#define VANTOR_ANALYZE_IMAGE_LIBRARYSEARCH_H

#include <string>
#include <vector>

#include "image/Architecture.h"
#include "image/HostImage.h"
#include "image/Linkage.h"
#include "image/LinkerCache.h"

namespace vantor::analyze {

// An object that needs a library. Both outlive the search.
struct Requirer {
    const std::string* path;
    const Linkage* linkage;
};

// Finds libraries where the dynamic linker of a host does (ld.so(8)): in the folders that objects
// name, in the linker's cache, and in the default folders of Debian's C library. At boot no
// environment names others.
class LibrarySearch {
public:
    // The image outlives this object.
    LibrarySearch(const HostImage& hostImage, const Architecture& bootArchitecture);

    // The path on the host of a library; empty when the linker finds none of its architecture. The
    // first of the chain needs it by that name, each was loaded for the one behind it.
    std::string Find(const std::string& name, const std::vector<Requirer>& chain) const;

    // What the boot program says of where to look holds for all that it loads.
    void SetProgram(const std::string& path, const Linkage& linkage);

private:
    bool IsLibrary(const std::string& path) const;
    std::string Expand(const std::string& text, const std::string& objectPath) const;
    // In the folders that an object names.
    std::string FindIn(const std::string& folders, const std::string& name,
                       const std::string& objectPath) const;
    std::string FindAlongChain(const std::string& name, const std::vector<Requirer>& chain) const;

    const HostImage& image;
    const Architecture boot;
    const LinkerCache cache;
    std::string defaultFolders;
    std::string libraryFolder;          // what $LIB stands for
    std::vector<std::string> variants;  // folders within folders, for newer processors
    std::string programPath;
    std::string programFolders;
};

}  // namespace vantor::analyze

#endif
