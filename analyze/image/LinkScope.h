#ifndef VANTOR_ANALYZE_IMAGE_LINKSCOPE_H
#define VANTOR_ANALYZE_IMAGE_LINKSCOPE_H

#include <cstddef>
#include <map>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "image/ObjectLoader.h"
#include "image/PluginSource.h"
#include "model/Finding.h"

namespace vantor::analyze {

// What the dynamic linker of a host would make of native plugins together with all other objects:
// the boot program, its libraries, the plugins, and the libraries of those. All but the program's
// are loaded in the order in which the directory happens to be listed, and all are visible to all.
// Loads nothing: reads the files.
class LinkScope {
public:
    // Reads the image's boot program and its libraries. The image outlives this object.
    LinkScope(const HostImage& hostImage, const Architecture& bootArchitecture);

    // A plugin that the linker is asked to open. Returns its number.
    std::size_t Open(const PluginSource& source, Linkage linkage);

    // Whether a library of the plugin's own defines a symbol: dlsym(3) finds it in the plugin.
    bool LibrariesDefine(std::size_t plugin, const std::string& symbol) const;

    // The boot keeps the plugin loaded. Of its parts those are given that it looks up by name.
    void Keep(std::size_t plugin, std::vector<SharedPart> parts);

    // Tells which plugins the linker refuses, in its words, which it would end the boot for, and
    // whose parts another object takes over; to be called once, when all are there. Returns the
    // paths of those it refuses.
    std::set<std::string> Report(Findings& findings);

    // The files of all libraries that the program and the plugins would bring with them.
    std::vector<std::string> Libraries() const { return loader.Paths(); }

private:
    // A library that only another plugin has, or is.
    struct Borrowed {
        std::string name;
        std::string owner;  // that plugin's path
    };
    struct Plugin {
        PluginSource source;
        ObjectPointer object;
        Closure own;                     // without what others bring
        Closure closure;                 // with that
        std::vector<Borrowed> borrowed;  // the difference
        std::vector<SharedPart> parts;
        bool isKept = false;
        bool isRefused = false;
        bool needsOthers = false;  // is not refused as long as other plugins are not
    };
    struct BroughtIn {
        ObjectPointer library;
        std::vector<std::size_t> owners;  // plugins, ascending
    };
    using PluginIndex = std::unordered_map<std::string, std::vector<std::size_t>>;

    void ReadProgram(const HostImage& image);
    bool TellUnchecked(Findings& findings) const;
    void IndexPlugins();
    bool Serves(std::size_t other, std::size_t plugin) const;
    std::vector<std::string> Others(const SymbolName& symbol, std::size_t plugin) const;
    ObjectPointer Borrow(const std::string& library, std::size_t plugin, std::string& owner) const;
    void BorrowLibraries(std::size_t plugin);
    std::string Exporter(const SymbolName& symbol) const;
    bool IsDefined(const SymbolName& symbol, const Closure& closure) const;
    const Object* FindLibrary(const std::string& name, const Closure& closure) const;

    // Each adds a finding of the first thing that the linker refuses the plugin for, if any.
    bool IsRefused(std::size_t plugin, Findings& findings);
    bool LacksLibrary(const Plugin& plugin, Findings& findings) const;
    bool LacksVersion(const Object& object, const Plugin& plugin, Findings& findings) const;
    bool LacksImport(const Object& object, std::size_t plugin, Findings& findings);

    void FindRefused(Findings& findings);
    static void TellUnreadable(const Plugin& plugin, Findings& findings);
    void CheckOrder(std::size_t plugin, Findings& findings) const;
    void CheckCalls(std::size_t plugin, Findings& findings) const;
    void CheckParts(std::size_t plugin, Findings& findings) const;

    ObjectLoader loader;
    std::string unknown;                 // why nothing can be told
    std::string broken;                  // the library that keeps the program itself from starting
    std::vector<ObjectPointer> program;  // itself first
    std::vector<Plugin> plugins;
    PluginIndex bySoname;
    PluginIndex bySymbol;
    std::map<std::string, BroughtIn> broughtIn;  // by the library's path
};

}  // namespace vantor::analyze

#endif
