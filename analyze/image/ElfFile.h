#ifndef VANTOR_ANALYZE_IMAGE_ELFFILE_H
#define VANTOR_ANALYZE_IMAGE_ELFFILE_H

#include <gelf.h>

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "image/Architecture.h"
#include "image/ElfBytes.h"

namespace vantor::analyze {

// An ELF file that cannot be taken apart.
class ElfError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// A shared object as the dynamic linker would lay it out at address 0, of any word size, byte order
// and machine; nothing of it is relocated yet (image/SharedObject.h). Only segments are looked at,
// as the linker does, so a stripped object reads like any other. No offset, size or count of the
// file is trusted.
class ElfFile {
public:
    // The content outlives this object. Throws ElfError.
    explicit ElfFile(const std::string& fileContent);

    const Architecture& Kind() const { return architecture; }
    std::size_t WordSize() const { return architecture.WordSize(); }
    std::uint64_t FileSize() const { return content.size(); }

    // The unsigned number of `size` bytes, at most 8, at an address; empty where nothing is loaded.
    std::optional<std::uint64_t> Number(std::uint64_t address, std::size_t size) const;

    // The bytes of the file from an address to the end of its segment's bytes in the file, at most
    // `limit`; none where nothing is loaded, or only zeros are.
    std::string_view Bytes(std::uint64_t address, std::uint64_t limit) const;

    // Whether the address is loaded but lies behind the segment's bytes in the file.
    bool IsZeroFilled(std::uint64_t address) const;

    // The entry of the dynamic section with that tag (DT_...), the last of several.
    std::optional<std::uint64_t> Dynamic(std::int64_t tag) const;

    // The path of the dynamic linker that a program asks for; empty where it asks for none.
    const std::string& Interpreter() const { return interpreter; }

    // The values of all entries DT_NEEDED, in the order of the file.
    const std::vector<std::uint64_t>& Needed() const { return needed; }

    // A table of the file as libelf converts it: at most `count` entries of a type. Null where not
    // all of it is in the file. Valid as long as this object.
    Elf_Data* Table(std::uint64_t address, std::uint64_t count, Elf_Type type) const;

private:
    struct Segment {
        std::uint64_t address, memorySize, offset, fileSize;  // wholly in the file
    };
    struct EndElf {
        void operator()(Elf* elf) const { elf_end(elf); }
    };

    void ReadSegments();
    void ReadDynamic(const GElf_Phdr& header);
    // Null where nothing is loaded.
    const Segment* SegmentAt(std::uint64_t address) const;

    const std::string& content;
    Architecture architecture;
    std::unique_ptr<Elf, EndElf> handle;
    std::vector<Segment> segments;  // by address
    std::map<std::int64_t, std::uint64_t> dynamic;
    std::vector<std::uint64_t> needed;
    std::string interpreter;
};

}  // namespace vantor::analyze

#endif
