#include "image/SymbolVersions.h"

#include <optional>

namespace vantor::analyze {

namespace {

// The records are the same at both word sizes; here are the offsets of the fields that are read.
struct NeededLibrary {  // Elf64_Verneed
    static constexpr std::uint64_t versionCount = 2, library = 4, firstVersion = 8, next = 12;
};
struct NeededVersion {  // Elf64_Vernaux
    static constexpr std::uint64_t flags = 4, number = 6, name = 8, next = 12;
};
struct DefinedVersion {  // Elf64_Verdef
    static constexpr std::uint64_t flags = 2, number = 4, firstName = 12, next = 16;
};

constexpr std::uint64_t numberBits = 0x7fff;

}  // namespace

SymbolVersions::SymbolVersions(const SharedObject& sharedObject)
    : object(sharedObject), file(object.File()), recordsLeft(file.FileSize() / 8) {
    if (const std::optional<std::uint64_t> table = file.Dynamic(DT_VERNEED)) {
        Walk(*table, file.Dynamic(DT_VERNEEDNUM).value_or(0), NeededLibrary::next,
             [this](std::uint64_t record) { ReadRequired(record); });
    }
    if (const std::optional<std::uint64_t> table = file.Dynamic(DT_VERDEF)) {
        Walk(*table, file.Dynamic(DT_VERDEFNUM).value_or(0), DefinedVersion::next,
             [this](std::uint64_t record) { ReadDefined(record); });
    }
}

void SymbolVersions::Walk(std::uint64_t address, std::uint64_t count, std::uint64_t next,
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

void SymbolVersions::ReadRequired(std::uint64_t record) {
    const std::string library = Text(record + NeededLibrary::library);
    Walk(record + Word(record + NeededLibrary::firstVersion),
         Half(record + NeededLibrary::versionCount), NeededVersion::next,
         [&](std::uint64_t version) {
             constexpr std::uint64_t weak = VER_FLG_WEAK;
             const std::string name = Text(version + NeededVersion::name);
             names[Half(version + NeededVersion::number) & numberBits] = name;
             if ((Half(version + NeededVersion::flags) & weak) == 0) {
                 required.push_back({library, name});
             }
         });
}

void SymbolVersions::ReadDefined(std::uint64_t record) {
    constexpr std::uint64_t base = VER_FLG_BASE;  // of the object as a whole, not of symbols
    const std::string name = Text(record + Word(record + DefinedVersion::firstName));
    defined.insert(name);
    if ((Half(record + DefinedVersion::flags) & base) == 0) {
        names[Half(record + DefinedVersion::number) & numberBits] = name;
    }
}

std::string SymbolVersions::NameOf(std::uint16_t entry) const {
    const auto name = names.find(entry & numberBits);
    return name == names.end() ? std::string() : name->second;
}

}  // namespace vantor::analyze
