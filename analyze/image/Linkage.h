#ifndef VANTOR_ANALYZE_IMAGE_LINKAGE_H
#define VANTOR_ANALYZE_IMAGE_LINKAGE_H

#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "image/SharedObject.h"
#include "image/SymbolVersions.h"

namespace vantor::analyze {

// A symbol as the linker looks for it.
struct SymbolName {
    std::string name;
    std::string version;  // empty: any

    // As the linker names it in its messages.
    std::string Text() const { return version.empty() ? name : name + ", version " + version; }
};

// What a program or shared object asks of other objects when it is loaded, and what it has for
// them.
class Linkage {
public:
    Linkage() = default;
    explicit Linkage(const SharedObject& object);

    // Whether the linker finds the symbol here.
    bool Defines(const SymbolName& symbol) const;

    // All that it has for others, by name.
    struct Definition {
        std::string version;
        bool isHidden;
    };
    const std::unordered_map<std::string, std::vector<Definition>>& Definitions() const {
        return definitions;
    }

    std::string interpreter;             // a program's dynamic linker
    std::string soname;                  // empty: it has none
    std::vector<std::string> needed;     // libraries, in the order of the file
    std::string runPath;                 // DT_RUNPATH: where its own libraries are looked for
    std::string inheritedPath;           // DT_RPATH, which holds without the other one only
    bool searchesDefaultFolders = true;  // after these
    std::vector<SymbolVersions::Required> requiredVersions;
    std::set<std::string> versions;       // that it defines itself; empty: it knows of none
    std::vector<SymbolName> loadImports;  // that loading looks up, in that order
    std::vector<SymbolName> callImports;  // that the first call of a function looks up

private:
    std::unordered_map<std::string, std::vector<Definition>> definitions;
};

}  // namespace vantor::analyze

#endif
