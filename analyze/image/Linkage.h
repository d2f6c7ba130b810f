#ifndef VANTOR_ANALYZE_IMAGE_LINKAGE_H
#define VANTOR_ANALYZE_IMAGE_LINKAGE_H

#include <set>
#include <string>
#include <vector>

#include "image/SharedObject.h"

namespace vantor::analyze {

// What a program or shared object asks of other objects when it is loaded, and what it has for
// them.
struct Linkage {
    // A version of a library's symbols that the linker insists on.
    struct Version {
        std::string library;  // as the object names it
        std::string name;
    };

    std::string interpreter;                // a program's dynamic linker
    std::string soname;                     // empty: it has none
    std::vector<std::string> needed;        // libraries, in the order of the file
    std::string runPath;                    // DT_RUNPATH: where its own libraries are looked for
    std::string inheritedPath;              // DT_RPATH, which holds without the other one only
    bool searchesDefaultFolders = true;     // after these
    std::vector<Version> requiredVersions;  // in the order of the file
    std::set<std::string> versions;         // that it defines itself; empty: it knows of none
    std::vector<std::string> loadImports;   // symbols that loading looks up, in that order
    std::vector<std::string> callImports;   // functions that the first call looks up
    std::vector<std::string> exports;       // symbols that others find in it
};

// No count or offset of the file is trusted; what lies outside of it is taken for missing.
Linkage ReadLinkage(const SharedObject& object);

}  // namespace vantor::analyze

#endif
