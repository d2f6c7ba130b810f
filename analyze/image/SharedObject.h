#ifndef VANTOR_ANALYZE_IMAGE_SHAREDOBJECT_H
#define VANTOR_ANALYZE_IMAGE_SHAREDOBJECT_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "image/ElfFile.h"

namespace vantor::analyze {

// What a pointer in an object's data will be once the object has been loaded.
struct LoadedPointer {
    enum class Kind {
        Null,
        Inside,   // the object itself, at `address`
        Outside,  // another object, which the file does not name
    };

    Kind kind = Kind::Null;
    std::uint64_t address = 0;
    // The exported symbol that the linker looks up for it, in all loaded objects; empty when it
    // looks up none, or only in this object. For one outside, the symbol of that object.
    std::string_view symbol;
    std::uint16_t version = 0;  // its entry in the table of versions
};

// The exported symbols of a shared object and its data with the dynamic relocations applied, of
// those that can occur in data: x86-64, i386, AArch64 and ARM. Takes time in proportion to the
// size of the file, and a logarithm for each pointer that is read.
class SharedObject {
public:
    // The file outlives this object. Throws ElfError for tables that lie outside of it.
    explicit SharedObject(const ElfFile& elfFile);

    struct Symbol {
        std::string_view name;
        std::uint64_t address;
        std::uint64_t size;     // 0: the object does not say
        std::uint16_t version;  // its entry in the table of versions (image/SymbolVersions.h)
    };

    // What dlsym(3) finds in the object, in the order of its table.
    const std::vector<Symbol>& Exports() const { return exports; }
    const Symbol* Find(std::string_view name) const;

    // A symbol that the object does not define itself and cannot do without.
    struct Import {
        std::string_view name;
        bool atLoad;  // else a lazy linker looks for it when the function is first called
        std::uint16_t version;
    };

    // Each once, in the order in which the linker looks for them.
    const std::vector<Import>& Imports() const { return imports; }

    // A text of the object's own table of names; empty where none is.
    std::string_view NameAt(std::uint64_t offset) const;

    // Empty where none is loaded, or where a relocation stands that is not known.
    std::optional<LoadedPointer> Pointer(std::uint64_t address) const;

    const ElfFile& File() const { return file; }

private:
    enum class Meaning { None, Relative, Absolute, AbsoluteWithoutAddend, Computed, Unknown };
    struct Relocation {
        std::uint64_t address;
        std::uint32_t type;
        std::uint32_t symbol;
        std::int64_t addend;
        bool hasAddend;  // else it stands in the place itself
    };

    void ReadSymbols();
    std::uint64_t CountSymbols() const;
    std::uint64_t CountHashedSymbols(std::uint64_t hash) const;
    void AddExport(const GElf_Sym& symbol, std::uint64_t symbolIndex);
    std::uint16_t VersionEntry(std::uint64_t symbolIndex) const;
    void ReadRelocations(std::int64_t tableTag, std::int64_t sizeTag, bool withAddends);
    void AddImport(std::uint32_t symbolIndex, bool atLoad);
    bool BindsAtLoad() const;
    static Meaning MeaningOf(std::uint16_t machine, std::uint32_t type);
    std::optional<LoadedPointer> ToSymbol(const Relocation& relocation, std::uint64_t addend) const;
    std::uint64_t Wrapped(std::uint64_t address) const;

    const ElfFile& file;
    std::string_view names;
    bool looksInItselfFirst = false;
    Elf_Data* symbols = nullptr;   // of the file; null where there are none
    std::vector<bool> isLookedUp;  // by the symbols' index
    std::vector<Symbol> exports;
    std::vector<Import> imports;
    std::vector<Relocation> relocations;  // by address
};

}  // namespace vantor::analyze

#endif
