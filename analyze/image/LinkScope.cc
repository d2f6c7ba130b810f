#include "image/LinkScope.h"

#include <algorithm>
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

// `what` is a kind of thing that only other plugins have, or bring with them.
Finding DependsOnOrder(const PluginSource& source, const std::string& what, const std::string& name,
                       const std::vector<std::string>& others) {
    return {Severity::Warning, "load-order", source.place,
            "the " + what + " \"" + name + "\" is that of " + Few(others) +
                ": the boot loads this one only if the directory lists that one before it"};
}

}  // namespace

LinkScope::LinkScope(const HostImage& hostImage, const Architecture& bootArchitecture)
    : loader(hostImage, bootArchitecture) {
    ReadProgram(hostImage);
}

void LinkScope::ReadProgram(const HostImage& image) {
    const std::string path = HostImage::program;
    // The linker starts from where the program really lies.
    const ObjectPointer itself = loader.Load(ResolveInImage(image, path));
    if (itself == nullptr) {
        unknown = "there is no boot program " + path + " to tell what they are loaded into";
        return;
    }
    if (!itself->unreadable.empty()) {
        unknown = "the boot program " + path + " cannot be read: " + itself->unreadable;
        return;
    }
    program.push_back(itself);
    loader.SetProgram(itself);
    const std::string& interpreter = itself->linkage.interpreter;
    const ObjectPointer linker = interpreter.empty() ? nullptr : loader.Load(interpreter);
    if (linker != nullptr) {
        loader.SetLoaded({linker});  // before all others, which know it by its name alone
    }
    const Closure closure = loader.Close(itself);
    if (!closure.missing.empty()) {
        broken = closure.missing.front();
    }
    program.insert(program.end(), closure.libraries.begin(), closure.libraries.end());
    if (linker != nullptr) {
        program.push_back(linker);
    }
    loader.SetLoaded(program);
}

std::size_t LinkScope::Open(const PluginSource& source, Linkage linkage) {
    Plugin plugin;
    plugin.source = source;
    plugin.object = std::make_shared<const Object>(Object{source.bootPath, std::move(linkage), {}});
    plugin.own = loader.Close(plugin.object);
    plugin.closure = plugin.own;
    plugins.push_back(std::move(plugin));
    return plugins.size() - 1;
}

bool LinkScope::LibrariesDefine(std::size_t plugin, const std::string& symbol) const {
    const std::vector<ObjectPointer>& libraries = plugins[plugin].own.libraries;
    return std::any_of(libraries.begin(), libraries.end(), [&](const ObjectPointer& library) {
        return library->linkage.Defines({symbol, {}});
    });
}

void LinkScope::Keep(std::size_t plugin, std::vector<SharedPart> parts) {
    plugins[plugin].isKept = true;
    plugins[plugin].parts = std::move(parts);
}

void LinkScope::IndexPlugins() {
    for (std::size_t i = 0; i < plugins.size(); ++i) {
        const Plugin& plugin = plugins[i];
        if (!plugin.isKept) {
            continue;
        }
        bySoname[plugin.object->linkage.soname].push_back(i);
        for (const auto& definition : plugin.object->linkage.Definitions()) {
            bySymbol[definition.first].push_back(i);
        }
        for (const ObjectPointer& library : plugin.own.libraries) {
            BroughtIn& brought = broughtIn[library->path];
            brought.library = library;
            brought.owners.push_back(i);
        }
    }
}

// Whether a plugin is loaded beside this one, and is not the same file under another name.
bool LinkScope::Serves(std::size_t other, std::size_t plugin) const {
    const PluginSource& source = plugins[other].source;
    return other != plugin && plugins[other].isKept && !plugins[other].isRefused &&
           (source.file.second == 0 || source.file != plugins[plugin].source.file);
}

// Who else has the symbol: plugins, and libraries that other plugins bring with them. A few.
std::vector<std::string> LinkScope::Others(const SymbolName& symbol, std::size_t plugin) const {
    std::vector<std::string> paths;
    const auto exporters = bySymbol.find(symbol.name);
    if (exporters != bySymbol.end()) {
        for (auto other = exporters->second.begin();
             other != exporters->second.end() && paths.size() <= mostNamed; ++other) {
            if (Serves(*other, plugin) && plugins[*other].object->linkage.Defines(symbol)) {
                paths.push_back(plugins[*other].source.place.path);
            }
        }
    }
    for (auto library = broughtIn.begin(); library != broughtIn.end() && paths.size() <= mostNamed;
         ++library) {
        const auto& [object, owners] = library->second;
        if (object->linkage.Defines(symbol) &&
            std::any_of(owners.begin(), owners.end(),
                        [&](std::size_t owner) { return Serves(owner, plugin); })) {
            paths.push_back(object->path);
        }
    }
    return paths;
}

ObjectPointer LinkScope::Borrow(const std::string& library, std::size_t plugin,
                                std::string& owner) const {
    const auto named = bySoname.find(library);
    if (named != bySoname.end()) {
        for (const std::size_t other : named->second) {
            if (Serves(other, plugin)) {
                owner = plugins[other].source.place.path;
                return plugins[other].object;
            }
        }
    }
    for (const auto& [path, brought] : broughtIn) {
        const auto other =
            std::find_if(brought.owners.begin(), brought.owners.end(),
                         [&](std::size_t candidate) { return Serves(candidate, plugin); });
        if (brought.library->linkage.soname == library && other != brought.owners.end()) {
            owner = plugins[*other].source.place.path;
            return brought.library;
        }
    }
    return nullptr;
}

// Completes what a plugin brings with it by what others may have brought before.
void LinkScope::BorrowLibraries(std::size_t plugin) {
    Plugin& one = plugins[plugin];
    if (one.own.missing.empty()) {
        return;
    }
    one.borrowed.clear();
    one.closure = loader.Close(one.object, [&](const std::string& name) {
        std::string owner;
        ObjectPointer object = Borrow(name, plugin, owner);
        if (object != nullptr) {
            one.borrowed.push_back({name, owner});
        }
        return object;
    });
    one.needsOthers = one.needsOthers || !one.borrowed.empty();
}

std::string LinkScope::Exporter(const SymbolName& symbol) const {
    const auto found =
        std::find_if(program.begin(), program.end(),
                     [&](const ObjectPointer& object) { return object->linkage.Defines(symbol); });
    return found == program.end() ? std::string() : (*found)->path;
}

// In the libraries of one that cannot be read anything may be.
bool LinkScope::IsDefined(const SymbolName& symbol, const Closure& closure) const {
    return !Exporter(symbol).empty() ||
           std::any_of(closure.libraries.begin(), closure.libraries.end(),
                       [&](const ObjectPointer& library) {
                           return !library->unreadable.empty() || library->linkage.Defines(symbol);
                       });
}

const Object* LinkScope::FindLibrary(const std::string& name, const Closure& closure) const {
    for (const std::vector<ObjectPointer>* const objects : {&program, &closure.libraries}) {
        const auto found =
            std::find_if(objects->begin(), objects->end(), [&](const ObjectPointer& object) {
                return object->linkage.soname == name ||
                       object->path.substr(object->path.find_last_of('/') + 1) == name;
            });
        if (found != objects->end()) {
            return found->get();
        }
    }
    return nullptr;
}

bool LinkScope::LacksLibrary(const Plugin& plugin, Findings& findings) const {
    if (plugin.closure.missing.empty()) {
        return false;
    }
    findings.push_back(Refusal("missing-library", plugin.source,
                               plugin.closure.missing.front() +
                                   ": cannot open shared object file: No such file or directory"));
    return true;
}

// A library that tells of no versions at all only makes the linker grumble.
bool LinkScope::LacksVersion(const Object& object, const Plugin& plugin, Findings& findings) const {
    for (const SymbolVersions::Required& version : object.linkage.requiredVersions) {
        const Object* const library = FindLibrary(version.library, plugin.closure);
        if (library != nullptr && !library->linkage.versions.empty() &&
            library->linkage.versions.count(version.name) == 0) {
            findings.push_back(Refusal("missing-version", plugin.source,
                                       library->path + ": version `" + version.name +
                                           "' not found (required by " + object.path + ")"));
            return true;
        }
    }
    return false;
}

bool LinkScope::LacksImport(const Object& object, std::size_t plugin, Findings& findings) {
    for (const SymbolName& symbol : object.linkage.loadImports) {
        if (IsDefined(symbol, plugins[plugin].closure) ||
            plugins[plugin].object->linkage.Defines(symbol)) {
            continue;
        }
        plugins[plugin].needsOthers = true;
        if (Others(symbol, plugin).empty()) {
            std::string reason = object.path;
            reason.append(": undefined symbol: ").append(symbol.Text());
            findings.push_back(Refusal("undefined-symbol", plugins[plugin].source, reason));
            return true;
        }
    }
    return false;
}

// In the linker's order: libraries, versions, and then symbols, those of the libraries first.
bool LinkScope::IsRefused(std::size_t plugin, Findings& findings) {
    BorrowLibraries(plugin);
    const Plugin& one = plugins[plugin];
    const std::vector<ObjectPointer>& libraries = one.closure.libraries;
    return LacksLibrary(one, findings) || LacksVersion(*one.object, one, findings) ||
           std::any_of(libraries.begin(), libraries.end(),
                       [&](const ObjectPointer& library) {
                           return LacksVersion(*library, one, findings);
                       }) ||
           std::any_of(libraries.rbegin(), libraries.rend(),
                       [&](const ObjectPointer& library) {
                           return LacksImport(*library, plugin, findings);
                       }) ||
           LacksImport(*one.object, plugin, findings);
}

void LinkScope::CheckOrder(std::size_t plugin, Findings& findings) const {
    const Plugin& one = plugins[plugin];
    for (const Borrowed& library : one.borrowed) {
        findings.push_back(DependsOnOrder(one.source, "library", library.name, {library.owner}));
    }
    std::vector<ObjectPointer> objects = one.closure.libraries;
    objects.push_back(one.object);
    for (const ObjectPointer& object : objects) {
        for (const SymbolName& symbol : object->linkage.loadImports) {
            if (!IsDefined(symbol, one.closure) && !one.object->linkage.Defines(symbol)) {
                findings.push_back(
                    DependsOnOrder(one.source, "symbol", symbol.name, Others(symbol, plugin)));
            }
        }
    }
}

// By the time of a call every plugin has been loaded, in whatever order.
void LinkScope::CheckCalls(std::size_t plugin, Findings& findings) const {
    const Plugin& one = plugins[plugin];
    std::vector<std::string> undefined;
    for (const SymbolName& symbol : one.object->linkage.callImports) {
        if (!IsDefined(symbol, one.closure) && Others(symbol, plugin).empty()) {
            undefined.push_back("\"" + symbol.name + "\"");
        }
    }
    if (!undefined.empty()) {
        std::sort(undefined.begin(), undefined.end());
        findings.push_back({Severity::Error, "undefined-symbol", one.source.place,
                            "no object defines " + Few(undefined) +
                                ", which it calls: the linker ends the boot at the call"});
    }
}

void LinkScope::CheckParts(std::size_t plugin, Findings& findings) const {
    const Plugin& one = plugins[plugin];
    for (const SharedPart& part : one.parts) {
        const std::string exporter = Exporter(part.symbol);
        const std::vector<std::string> others = Others(part.symbol, plugin);
        std::string who;
        if (!exporter.empty()) {
            who =
                exporter + " too, which the boot program has loaded before: it serves this plugin";
        } else if (!others.empty()) {
            who = Few(others) + " too: whichever is loaded first serves all of them";
        } else {
            continue;
        }
        findings.push_back({Severity::Error, "taken-over", one.source.place,
                            part.what + " is looked up by its exported name \"" + part.symbol.name +
                                "\", which is exported by " + who});
    }
}

// Returns whether the linker's doings are unknown.
bool LinkScope::TellUnchecked(Findings& findings) const {
    const Place place{HostImage::program, 0, 0};
    if (!broken.empty()) {
        findings.push_back(
            {Severity::Error, "missing-library", place,
             "the boot program cannot start: its library " + broken + " is not found"});
    }
    if (unknown.empty() && broken.empty()) {
        return false;
    }
    findings.push_back({Severity::Note, "unchecked-objects", place,
                        "what native plugins need of other objects is not checked" +
                            (unknown.empty() ? std::string() : ": " + unknown)});
    return true;
}

void LinkScope::TellUnreadable(const Plugin& plugin, Findings& findings) {
    for (const ObjectPointer& library : plugin.closure.libraries) {
        if (!library->unreadable.empty()) {
            findings.push_back(
                {Severity::Note, "unchecked-objects", plugin.source.place,
                 "its library " + library->path + " cannot be read: " + library->unreadable});
        }
    }
}

// One that is refused serves nobody, so that others may be refused that were not before.
void LinkScope::FindRefused(Findings& findings) {
    bool isSettled = false;
    for (bool isFirst = true; !isSettled; isFirst = false) {
        isSettled = true;
        for (std::size_t i = 0; i < plugins.size(); ++i) {
            if (!plugins[i].isRefused && (isFirst || plugins[i].needsOthers) &&
                IsRefused(i, findings)) {
                plugins[i].isRefused = true;
                isSettled = false;
            }
        }
    }
}

std::set<std::string> LinkScope::Report(Findings& findings) {
    std::set<std::string> refused;
    if (plugins.empty() || TellUnchecked(findings)) {
        return refused;
    }
    IndexPlugins();
    FindRefused(findings);
    for (std::size_t i = 0; i < plugins.size(); ++i) {
        TellUnreadable(plugins[i], findings);
        if (plugins[i].isRefused) {
            refused.insert(plugins[i].source.place.path);
            continue;
        }
        CheckOrder(i, findings);
        CheckCalls(i, findings);
        CheckParts(i, findings);
    }
    return refused;
}

}  // namespace vantor::analyze
