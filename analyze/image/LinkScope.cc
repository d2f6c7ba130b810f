#include "image/LinkScope.h"

#include <algorithm>
#include <iterator>
#include <utility>

#include "image/ImageFile.h"
#include "plugins/Exceptions.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t mostNamed = 3;  // things of a kind in one sentence

// "a, b, c and others".
std::string Few(const std::vector<std::string>& names) {
    std::string text;
    for (std::size_t i = 0; i < names.size() && i < mostNamed; ++i) {
        text += (i == 0 ? "" : ", ") + names[i];
    }
    return text + (names.size() > mostNamed ? " and others" : "");
}

Finding Refusal(const std::string& code, const PluginSource& source, const std::string& reason) {
    return {Severity::Error, code, source.place,
            InvalidPluginException(source.bootPath, reason).what()};
}

// `what` is a kind of thing that only other plugins have.
Finding DependsOnOrder(const PluginSource& source, const std::string& what, const std::string& name,
                       const std::vector<std::string>& others) {
    return {Severity::Warning, "load-order", source.place,
            "the " + what + " \"" + name + "\" is that of " + Few(others) +
                ": the boot loads this one only if the directory lists that one before it"};
}

}  // namespace

LinkScope::LinkScope(const HostImage& hostImage, const Architecture& bootArchitecture)
    : image(hostImage), search(hostImage, bootArchitecture) {
    ReadProgram();
}

void LinkScope::ReadProgram() {
    const std::string path = HostImage::program;
    const std::shared_ptr<const Library> itself = Load(path);
    if (itself == nullptr) {
        unknown = "there is no boot program " + path + " to tell what they are loaded into";
        return;
    }
    program.push_back(itself);
    // It is loaded before all others, and known to them by its name alone.
    const std::string& linker = itself->linkage.interpreter;
    if (const auto loader = linker.empty() ? nullptr : Load(linker)) {
        programNames.insert(linker.substr(linker.find_last_of('/') + 1));
        programNames.insert(loader->linkage.soname);
        program.push_back(loader);
    }
    search.SetInheritedPath(itself->linkage.inheritedPath);
    Closure closure = Close(path, itself->linkage);
    broken = closure.missing;
    program.insert(std::next(program.begin()), closure.libraries.begin(), closure.libraries.end());
    for (const std::shared_ptr<const Library>& library : program) {
        programNames.insert(library->linkage.soname);
        programNames.insert(library->linkage.needed.begin(), library->linkage.needed.end());
        for (const std::string& symbol : library->exports) {
            programExports.emplace(symbol, library->path);
        }
    }
}

std::shared_ptr<const LinkScope::Library> LinkScope::Load(const std::string& path) {
    const auto known = loaded.find(path);
    if (known != loaded.end()) {
        return known->second;
    }
    std::shared_ptr<const Library> library;
    try {
        const ImageFile object = ReadImageFile(image, path);
        const ElfFile file(object.content);
        Linkage linkage = ReadLinkage(SharedObject(file));
        std::unordered_set<std::string> exports(linkage.exports.begin(), linkage.exports.end());
        library =
            std::make_shared<const Library>(Library{path, std::move(linkage), std::move(exports)});
    } catch (const ElfError&) {
        // To the linker too it is none.
    }
    loaded.emplace(path, library);
    return library;
}

LinkScope::Closure LinkScope::Close(const std::string& path, const Linkage& linkage) {
    Closure closure;
    std::set<std::string> names = programNames;
    std::vector<std::pair<std::string, const Linkage*>> open{{path, &linkage}};
    for (std::size_t i = 0; i < open.size(); ++i) {
        const auto [requirer, needs] = open[i];
        for (const std::string& name : needs->needed) {
            if (!names.insert(name).second) {
                continue;
            }
            const std::string found = search.Find(name, requirer, *needs);
            const std::shared_ptr<const Library> library = found.empty() ? nullptr : Load(found);
            if (library == nullptr) {
                closure.missing = name;
                return closure;
            }
            const std::string& soname = library->linkage.soname;
            if (soname.empty() || soname == name || names.insert(soname).second) {
                closure.libraries.push_back(library);
                open.emplace_back(library->path, &library->linkage);
            }
        }
    }
    return closure;
}

void LinkScope::Open(const PluginSource& source, Linkage linkage) {
    plugins.push_back({source, std::move(linkage)});
}

std::string LinkScope::Exporter(const std::string& symbol) const {
    const auto found = programExports.find(symbol);
    return found == programExports.end() ? std::string() : found->second;
}

bool LinkScope::IsDefined(const std::string& symbol, const Closure& closure) const {
    return programExports.count(symbol) != 0 ||
           std::any_of(closure.libraries.begin(), closure.libraries.end(),
                       [&](const auto& library) { return library->exports.count(symbol) != 0; });
}

void LinkScope::IndexPlugins() {
    const auto add = [](std::vector<std::size_t>& list, std::size_t plugin) {
        // Who they are is told of a few only: no list grows with the directory.
        if (list.size() <= mostNamed + 1) {
            list.push_back(plugin);
        }
    };
    for (std::size_t i = 0; i < plugins.size(); ++i) {
        if (kept.count(plugins[i].source.place.path) == 0) {
            continue;
        }
        add(pluginsByName[plugins[i].linkage.soname], i);
        for (const std::string& symbol : plugins[i].linkage.exports) {
            add(pluginsBySymbol[symbol], i);
        }
    }
}

std::vector<std::string> LinkScope::Others(const PluginIndex& index, const std::string& key,
                                           const Plugin& plugin) const {
    std::vector<std::string> paths;
    const auto found = index.find(key);
    if (found != index.end()) {
        for (const std::size_t other : found->second) {
            if (&plugins[other] != &plugin) {
                paths.push_back(plugins[other].source.place.path);
            }
        }
    }
    return paths;
}

bool LinkScope::HasLibraries(const Plugin& plugin, const Closure& closure,
                             Findings& findings) const {
    if (closure.missing.empty()) {
        return true;
    }
    const std::vector<std::string> others = Others(pluginsByName, closure.missing, plugin);
    if (!others.empty()) {
        findings.push_back(DependsOnOrder(plugin.source, "library", closure.missing, others));
        return true;
    }
    findings.push_back(Refusal("missing-library", plugin.source,
                               closure.missing + ": cannot open shared object file: No such file "
                                                 "or directory"));
    return false;
}

const LinkScope::Library* LinkScope::FindLibrary(const std::string& name,
                                                 const Closure& closure) const {
    for (const Libraries* const libraries : {&program, &closure.libraries}) {
        const auto found =
            std::find_if(libraries->begin(), libraries->end(), [&](const auto& library) {
                return library->linkage.soname == name ||
                       library->path.substr(library->path.find_last_of('/') + 1) == name;
            });
        if (found != libraries->end()) {
            return found->get();
        }
    }
    return nullptr;
}

// A library that tells of no versions at all only makes the linker grumble.
bool LinkScope::HasVersions(const Plugin& plugin, const Closure& closure,
                            Findings& findings) const {
    const auto lacks = [&](const Linkage& linkage, const std::string& path) {
        for (const Linkage::Version& version : linkage.requiredVersions) {
            const Library* const library = FindLibrary(version.library, closure);
            if (library != nullptr && !library->linkage.versions.empty() &&
                library->linkage.versions.count(version.name) == 0) {
                findings.push_back(Refusal("missing-version", plugin.source,
                                           library->path + ": version `" + version.name +
                                               "' not found (required by " + path + ")"));
                return true;
            }
        }
        return false;
    };
    return !lacks(plugin.linkage, plugin.source.bootPath) &&
           std::none_of(
               closure.libraries.begin(), closure.libraries.end(),
               [&](const auto& library) { return lacks(library->linkage, library->path); });
}

// Whether an object that is loaded for a plugin, or the plugin itself, finds the symbols of its
// data.
bool LinkScope::FindsLoadImports(const Library& object, const Plugin& plugin,
                                 const Closure& closure, Findings& findings) const {
    const std::vector<std::string>& own = plugin.linkage.exports;
    for (const std::string& symbol : object.linkage.loadImports) {
        if (IsDefined(symbol, closure) || std::find(own.begin(), own.end(), symbol) != own.end()) {
            continue;
        }
        const std::vector<std::string> others = Others(pluginsBySymbol, symbol, plugin);
        if (others.empty()) {
            std::string reason = object.path;
            reason.append(": undefined symbol: ").append(symbol);
            findings.push_back(Refusal("undefined-symbol", plugin.source, reason));
            return false;
        }
        findings.push_back(DependsOnOrder(plugin.source, "symbol", symbol, others));
    }
    return true;
}

// The linker looks at the libraries before it looks at what needs them.
bool LinkScope::HasLoadImports(const Plugin& plugin, const Closure& closure,
                               Findings& findings) const {
    const auto finds = [&](const Library& object) {
        return FindsLoadImports(object, plugin, closure, findings);
    };
    return std::all_of(closure.libraries.rbegin(), closure.libraries.rend(),
                       [&](const auto& library) { return finds(*library); }) &&
           finds({plugin.source.bootPath, plugin.linkage, {}});
}

// By then every plugin has been loaded, in whatever order.
void LinkScope::CheckCallImports(const Plugin& plugin, const Closure& closure,
                                 Findings& findings) const {
    std::vector<std::string> undefined;
    for (const std::string& symbol : plugin.linkage.callImports) {
        if (!IsDefined(symbol, closure) && Others(pluginsBySymbol, symbol, plugin).empty()) {
            undefined.push_back("\"" + symbol + "\"");
        }
    }
    if (!undefined.empty()) {
        std::sort(undefined.begin(), undefined.end());
        findings.push_back({Severity::Error, "undefined-symbol", plugin.source.place,
                            "no object defines " + Few(undefined) +
                                ", which it calls: the linker ends the boot at the call"});
    }
}

std::set<std::string> LinkScope::Report(Findings& findings) {
    std::set<std::string> refused;
    if (plugins.empty()) {
        return refused;
    }
    if (!broken.empty()) {
        findings.push_back(
            {Severity::Error,
             "missing-library",
             {HostImage::program, 0, 0},
             "the boot program cannot start: its library " + broken + " is not found"});
    }
    if (!unknown.empty() || !broken.empty()) {
        findings.push_back({Severity::Note,
                            "unchecked-objects",
                            {HostImage::program, 0, 0},
                            "what native plugins need of other objects is not checked" +
                                (unknown.empty() ? std::string() : ": " + unknown)});
        return refused;
    }
    IndexPlugins();
    for (const Plugin& plugin : plugins) {
        const Closure closure = Close(plugin.source.bootPath, plugin.linkage);
        if (!HasLibraries(plugin, closure, findings) || !HasVersions(plugin, closure, findings) ||
            !HasLoadImports(plugin, closure, findings)) {
            refused.insert(plugin.source.place.path);
        } else if (closure.missing.empty()) {
            CheckCallImports(plugin, closure, findings);
        }
    }
    return refused;
}

}  // namespace vantor::analyze
