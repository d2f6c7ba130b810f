#include "image/Linkage.h"

#include <algorithm>
#include <cstdint>
#include <optional>

namespace vantor::analyze {

Linkage::Linkage(const SharedObject& object) {
    const ElfFile& file = object.File();
    const auto text = [&](std::int64_t tag) {
        const std::optional<std::uint64_t> offset = file.Dynamic(tag);
        return offset ? std::string(object.NameAt(*offset)) : std::string();
    };
    interpreter = file.Interpreter();
    soname = text(DT_SONAME);
    runPath = text(DT_RUNPATH);
    inheritedPath = file.Dynamic(DT_RUNPATH) ? std::string() : text(DT_RPATH);
    constexpr std::uint64_t noDefaultFolders = DF_1_NODEFLIB;
    searchesDefaultFolders = (file.Dynamic(DT_FLAGS_1).value_or(0) & noDefaultFolders) == 0;
    for (const std::uint64_t name : file.Needed()) {
        needed.emplace_back(object.NameAt(name));
    }
    const SymbolVersions known(object);
    requiredVersions = known.AllRequired();
    versions = known.AllDefined();
    for (const SharedObject::Import& import : object.Imports()) {
        (import.atLoad ? loadImports : callImports)
            .push_back({std::string(import.name), known.NameOf(import.version)});
    }
    for (const SharedObject::Symbol& symbol : object.Exports()) {
        definitions[std::string(symbol.name)].push_back(
            {known.NameOf(symbol.version), SymbolVersions::IsHidden(symbol.version)});
    }
}

// Who asks for a version takes a symbol without one too: of an object that knows of no versions.
bool Linkage::Defines(const SymbolName& symbol) const {
    const auto found = definitions.find(symbol.name);
    return found != definitions.end() &&
           std::any_of(found->second.begin(), found->second.end(), [&](const Definition& one) {
               return symbol.version.empty() || one.version.empty() ? !one.isHidden
                                                                    : one.version == symbol.version;
           });
}

}  // namespace vantor::analyze
