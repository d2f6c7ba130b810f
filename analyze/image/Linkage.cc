#include "image/Linkage.h"

#include <cstdint>
#include <functional>
#include <optional>

namespace vantor::analyze {

namespace {

// The records of symbol versions are the same at both word sizes (elf(5)); here are the offsets of
// the fields that are read.
struct NeededLibrary {  // Elf64_Verneed
    static constexpr std::uint64_t versionCount = 2, library = 4, firstVersion = 8, next = 12;
};
struct NeededVersion {  // Elf64_Vernaux
    static constexpr std::uint64_t flags = 4, name = 8, next = 12;
};
struct DefinedVersion {  // Elf64_Verdef
    static constexpr std::uint64_t firstName = 12, next = 16;
};

class VersionReader {
public:
    explicit VersionReader(const SharedObject& sharedObject)
        : object(sharedObject), file(object.File()), recordsLeft(file.FileSize() / 8) {}

    void ReadRequired(Linkage& linkage);
    void ReadDefined(Linkage& linkage);

private:
    std::uint64_t Half(std::uint64_t address) const { return file.Number(address, 2).value_or(0); }
    std::uint64_t Word(std::uint64_t address) const { return file.Number(address, 4).value_or(0); }

    // Visits the records of a list whose field `next` holds the distance to the one behind it.
    void Walk(std::uint64_t address, std::uint64_t count, std::uint64_t next,
              const std::function<void(std::uint64_t)>& visit);
    void ReadVersions(std::uint64_t record, Linkage& linkage);

    const SharedObject& object;
    const ElfFile& file;
    std::uint64_t recordsLeft;  // more than that only a list has that runs in circles
};

void VersionReader::Walk(std::uint64_t address, std::uint64_t count, std::uint64_t next,
                         const std::function<void(std::uint64_t)>& visit) {
    for (std::uint64_t i = 0; i < count && recordsLeft > 0; ++i) {
        --recordsLeft;
        visit(address);
        const std::uint64_t distance = Word(address + next);
        if (distance == 0) {
            return;
        }
        address += distance;
    }
}

void VersionReader::ReadRequired(Linkage& linkage) {
    const std::optional<std::uint64_t> table = file.Dynamic(DT_VERNEED);
    if (table) {
        Walk(*table, file.Dynamic(DT_VERNEEDNUM).value_or(0), NeededLibrary::next,
             [&](std::uint64_t record) { ReadVersions(record, linkage); });
    }
}

void VersionReader::ReadVersions(std::uint64_t record, Linkage& linkage) {
    const std::string library(object.NameAt(Word(record + NeededLibrary::library)));
    Walk(record + Word(record + NeededLibrary::firstVersion),
         Half(record + NeededLibrary::versionCount), NeededVersion::next,
         [&](std::uint64_t version) {
             constexpr std::uint64_t weak = VER_FLG_WEAK;
             if ((Half(version + NeededVersion::flags) & weak) == 0) {
                 linkage.requiredVersions.push_back(
                     {library, std::string(object.NameAt(Word(version + NeededVersion::name)))});
             }
         });
}

void VersionReader::ReadDefined(Linkage& linkage) {
    const std::optional<std::uint64_t> table = file.Dynamic(DT_VERDEF);
    if (table) {
        Walk(*table, file.Dynamic(DT_VERDEFNUM).value_or(0), DefinedVersion::next,
             [&](std::uint64_t record) {
                 const std::uint64_t name = Word(record + Word(record + DefinedVersion::firstName));
                 linkage.versions.emplace(object.NameAt(name));
             });
    }
}

}  // namespace

Linkage ReadLinkage(const SharedObject& object) {
    const ElfFile& file = object.File();
    const auto text = [&](std::int64_t tag) {
        const std::optional<std::uint64_t> offset = file.Dynamic(tag);
        return offset ? std::string(object.NameAt(*offset)) : std::string();
    };
    Linkage linkage;
    linkage.interpreter = file.Interpreter();
    linkage.soname = text(DT_SONAME);
    linkage.runPath = text(DT_RUNPATH);
    linkage.inheritedPath = file.Dynamic(DT_RUNPATH) ? std::string() : text(DT_RPATH);
    constexpr std::uint64_t noDefaultFolders = DF_1_NODEFLIB;
    linkage.searchesDefaultFolders = (file.Dynamic(DT_FLAGS_1).value_or(0) & noDefaultFolders) == 0;
    for (const std::uint64_t name : file.Needed()) {
        linkage.needed.emplace_back(object.NameAt(name));
    }
    for (const SharedObject::Import& import : object.Imports()) {
        (import.atLoad ? linkage.loadImports : linkage.callImports).emplace_back(import.name);
    }
    for (const SharedObject::Symbol& symbol : object.Exports()) {
        linkage.exports.emplace_back(symbol.name);
    }
    VersionReader versions(object);
    versions.ReadRequired(linkage);
    versions.ReadDefined(linkage);
    return linkage;
}

}  // namespace vantor::analyze
