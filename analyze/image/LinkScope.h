#ifndef VANTOR_ANALYZE_IMAGE_LINKSCOPE_H
#define VANTOR_ANALYZE_IMAGE_LINKSCOPE_H

#include <map>
#include <memory>
#include <set>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "image/LibrarySearch.h"
#include "image/Linkage.h"
#include "image/NativeDescription.h"
#include "model/Finding.h"

namespace vantor::analyze {

// What the dynamic linker of a host would make of native plugins together with all other objects:
// the boot program, its libraries, the libraries of plugins, and the plugins themselves, whose
// symbols are visible to all. Loads nothing: reads the files.
class LinkScope {
public:
    // Reads the image's boot program and its libraries. The image outlives this object.
    LinkScope(const HostImage& hostImage, const Architecture& bootArchitecture);

    // A plugin that the linker is asked to open, and one of those that the boot then keeps.
    void Open(const PluginSource& source, Linkage linkage);
    void Keep(const PluginSource& source) { kept.insert(source.place.path); }

    // The program, or the library of it, that exports a symbol: it serves all plugins. Empty when
    // none does.
    std::string Exporter(const std::string& symbol) const;

    // Tells which plugins the linker refuses, in its words, and which it would end the boot for;
    // to be called when all are there. Returns the paths of those it refuses.
    std::set<std::string> Report(Findings& findings);

private:
    struct Library {
        std::string path;
        Linkage linkage;
        std::unordered_set<std::string> exports;
    };
    using Libraries = std::vector<std::shared_ptr<const Library>>;

    struct Plugin {
        PluginSource source;
        Linkage linkage;
    };

    using PluginIndex = std::unordered_map<std::string, std::vector<std::size_t>>;

    // An object with what is loaded for it alone, in the linker's order.
    struct Closure {
        Libraries libraries;
        std::string missing;  // the first library that is not found
    };

    // The paths of the kept plugins but this one that an index holds under a key.
    std::vector<std::string> Others(const PluginIndex& index, const std::string& key,
                                    const Plugin& plugin) const;
    std::shared_ptr<const Library> Load(const std::string& path);
    Closure Close(const std::string& path, const Linkage& linkage);
    void ReadProgram();
    bool IsDefined(const std::string& symbol, const Closure& closure) const;
    void IndexPlugins();
    const Library* FindLibrary(const std::string& name, const Closure& closure) const;

    // Each tells of the first thing that the linker refuses the plugin for, if there is one.
    bool HasLibraries(const Plugin& plugin, const Closure& closure, Findings& findings) const;
    bool HasVersions(const Plugin& plugin, const Closure& closure, Findings& findings) const;
    bool FindsLoadImports(const Library& object, const Plugin& plugin, const Closure& closure,
                          Findings& findings) const;
    bool HasLoadImports(const Plugin& plugin, const Closure& closure, Findings& findings) const;
    void CheckCallImports(const Plugin& plugin, const Closure& closure, Findings& findings) const;

    const HostImage& image;
    LibrarySearch search;
    std::string unknown;  // why nothing can be told
    std::string broken;   // the library that keeps the program itself from starting
    std::map<std::string, std::shared_ptr<const Library>> loaded;  // by path; null: unreadable
    Libraries program;                                             // itself first
    std::set<std::string> programNames;  // by which its libraries are known to be loaded
    std::unordered_map<std::string, std::string> programExports;  // symbol to path
    std::vector<Plugin> plugins;
    std::set<std::string> kept;
    PluginIndex pluginsByName;  // as a library: DT_SONAME
    PluginIndex pluginsBySymbol;
};

}  // namespace vantor::analyze

#endif
