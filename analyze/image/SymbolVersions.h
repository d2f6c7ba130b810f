#ifndef VANTOR_ANALYZE_IMAGE_SYMBOLVERSIONS_H
#define VANTOR_ANALYZE_IMAGE_SYMBOLVERSIONS_H

#include <cstdint>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "image/SharedObject.h"

namespace vantor::analyze {

// The versions of an object's symbols, its own and those that it asks of libraries (the records of
// elf(5); "ELF Handling of Symbol Versioning" in the Linux Standard Base). No count or offset of
// the file is trusted; what lies outside of it is taken for missing.
class SymbolVersions {
public:
    // A version of a library's symbols that the linker insists on.
    struct Required {
        std::string library;  // as the object names it
        std::string name;
    };

    explicit SymbolVersions(const SharedObject& object);

    // In the order of the file.
    const std::vector<Required>& AllRequired() const { return required; }
    // That it defines itself; empty: it knows of none.
    const std::set<std::string>& AllDefined() const { return defined; }

    // Of a symbol with that entry in the table of versions; empty for one that has no version.
    std::string NameOf(std::uint16_t entry) const;
    // Whether only those find the symbol who ask for its version.
    static bool IsHidden(std::uint16_t entry) { return (entry & 0x8000U) != 0; }

private:
    std::uint64_t Half(std::uint64_t address) const { return file.Number(address, 2).value_or(0); }
    std::uint64_t Word(std::uint64_t address) const { return file.Number(address, 4).value_or(0); }
    std::string Text(std::uint64_t place) const { return std::string(object.NameAt(Word(place))); }

    // Visits the records of a list whose field `next` holds the distance to the one behind it.
    void Walk(std::uint64_t address, std::uint64_t count, std::uint64_t next,
              const std::function<void(std::uint64_t)>& visit);
    void ReadRequired(std::uint64_t record);
    void ReadDefined(std::uint64_t record);

    const SharedObject& object;
    const ElfFile& file;
    std::uint64_t recordsLeft;  // more than that only a list has that runs in circles
    std::vector<Required> required;
    std::set<std::string> defined;
    std::map<std::uint64_t, std::string> names;  // by the number that symbols have
};

}  // namespace vantor::analyze

#endif
