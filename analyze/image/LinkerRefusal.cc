#include "image/LinkerRefusal.h"

#include <elf.h>

#include <algorithm>
#include <cstddef>
#include <cstring>

#include "image/ElfBytes.h"

namespace vantor::analyze {

namespace {

using Kind = LinkerRefusal::Kind;

// The first ABI version of a GNU object that the C library of Debian 12 does not know.
constexpr unsigned char unknownAbiVersion = 4;
constexpr std::uint64_t pageSize = 4096;

// Where the fields of both word sizes lie. `word` is the size of an address in the file.
struct HeaderLayout {
    explicit HeaderLayout(const Architecture& boot)
        : word(boot.WordSize()), segmentHeader(boot.SegmentHeaderSize()) {
        const bool narrow = word == 4;
        version = offsetof(Elf64_Ehdr, e_version);
        segments = narrow ? offsetof(Elf32_Ehdr, e_phoff) : offsetof(Elf64_Ehdr, e_phoff);
        entrySize = narrow ? offsetof(Elf32_Ehdr, e_phentsize) : offsetof(Elf64_Ehdr, e_phentsize);
        count = narrow ? offsetof(Elf32_Ehdr, e_phnum) : offsetof(Elf64_Ehdr, e_phnum);
        offset = narrow ? offsetof(Elf32_Phdr, p_offset) : offsetof(Elf64_Phdr, p_offset);
        address = narrow ? offsetof(Elf32_Phdr, p_vaddr) : offsetof(Elf64_Phdr, p_vaddr);
        fileSize = narrow ? offsetof(Elf32_Phdr, p_filesz) : offsetof(Elf64_Phdr, p_filesz);
    }

    std::size_t word;
    std::size_t segmentHeader;
    std::size_t version, segments, entrySize, count;  // of the file's header
    std::size_t offset, address, fileSize;            // of a segment's header
};

// One segment, as far as the linker checks it.
struct SegmentHeader {
    std::uint64_t type, offset, address, fileSize;
};

// Reads headers of the boot's architecture, which the file may lack or have otherwise.
class Examination {
public:
    Examination(const std::string& fileContent, const Architecture& bootArchitecture)
        : content(fileContent),
          boot(bootArchitecture),
          layout(boot),
          bytes(content, boot.byteOrder) {}

    LinkerRefusal Run() const;

private:
    std::uint64_t Number(std::uint64_t offset, std::size_t size) const {
        return bytes.Number(offset, size).value_or(0);
    }
    unsigned char Ident(std::size_t at) const { return static_cast<unsigned char>(content[at]); }

    LinkerRefusal JudgeIdent() const;
    LinkerRefusal JudgeHeader() const;
    LinkerRefusal JudgeSegments() const;
    bool ReadSegment(std::uint64_t index, SegmentHeader& segment) const;
    bool IsCutShort(const SegmentHeader& segment) const {
        return segment.fileSize != 0 &&
               (segment.offset > bytes.Size() || segment.fileSize > bytes.Size() - segment.offset);
    }

    const std::string& content;
    const Architecture boot;
    const HeaderLayout layout;
    const ElfBytes bytes;
};

LinkerRefusal Examination::JudgeIdent() const {
    if (std::memcmp(content.data(), ELFMAG, SELFMAG) != 0) {
        return {Kind::Refused, "invalid ELF header"};
    }
    if (Ident(EI_CLASS) != boot.wordClass) {
        const bool known = Ident(EI_CLASS) == ELFCLASS32 || Ident(EI_CLASS) == ELFCLASS64;
        return {known ? Kind::Foreign : Kind::Refused, boot.wordClass == ELFCLASS32
                                                           ? "wrong ELF class: ELFCLASS64"
                                                           : "wrong ELF class: ELFCLASS32"};
    }
    if (Ident(EI_DATA) != boot.byteOrder) {
        const bool known = Ident(EI_DATA) == ELFDATA2LSB || Ident(EI_DATA) == ELFDATA2MSB;
        return {known ? Kind::Foreign : Kind::Refused,
                boot.byteOrder == ELFDATA2LSB ? "ELF file data encoding not little-endian"
                                              : "ELF file data encoding not big-endian"};
    }
    if (Ident(EI_VERSION) != EV_CURRENT) {
        return {Kind::Refused, "ELF file version ident does not match current one"};
    }
    const unsigned char abi = Ident(EI_OSABI);
    if (abi != ELFOSABI_SYSV && abi != ELFOSABI_GNU) {
        return {Kind::Refused, "ELF file OS ABI invalid"};
    }
    const unsigned char abiVersion = Ident(EI_ABIVERSION);
    if (abiVersion != 0 && (abi != ELFOSABI_GNU || abiVersion >= unknownAbiVersion)) {
        return {Kind::Refused, "ELF file ABI version invalid"};
    }
    const bool padded = std::all_of(content.begin() + EI_PAD, content.begin() + EI_NIDENT,
                                    [](char byte) { return byte == 0; });
    return padded ? LinkerRefusal{} : LinkerRefusal{Kind::Refused, "nonzero padding in e_ident"};
}

LinkerRefusal Examination::JudgeHeader() const {
    if (Number(layout.version, 4) != EV_CURRENT) {
        return {Kind::Refused, "ELF file version does not match current one"};
    }
    if (Number(offsetof(Elf64_Ehdr, e_machine), 2) != boot.machine) {
        // The linker goes on looking for a better file, and finds none.
        return {Kind::Foreign, "cannot open shared object file: No such file or directory"};
    }
    const std::uint64_t type = Number(offsetof(Elf64_Ehdr, e_type), 2);
    if (type != ET_DYN && type != ET_EXEC) {
        return {Kind::Refused, "only ET_DYN and ET_EXEC can be loaded"};
    }
    if (Number(layout.entrySize, 2) != layout.segmentHeader) {
        return {Kind::Refused, "ELF file's phentsize not the expected size"};
    }
    return {};
}

// False when the file ends before it.
bool Examination::ReadSegment(std::uint64_t index, SegmentHeader& segment) const {
    const std::uint64_t table = Number(layout.segments, layout.word);
    const std::uint64_t size = layout.segmentHeader;
    if (table > bytes.Size() || (index + 1) * size > bytes.Size() - table) {
        return false;
    }
    const std::uint64_t start = table + index * size;
    segment = {Number(start, 4), Number(start + layout.offset, layout.word),
               Number(start + layout.address, layout.word),
               Number(start + layout.fileSize, layout.word)};
    return true;
}

LinkerRefusal Examination::JudgeSegments() const {
    const std::uint64_t count = Number(layout.count, 2);
    const bool isShared = Number(offsetof(Elf64_Ehdr, e_type), 2) == ET_DYN;
    bool loads = false;
    bool hasDynamic = false;
    bool misaligned = false;
    for (std::uint64_t i = 0; i < count; ++i) {
        SegmentHeader segment{};
        if (!ReadSegment(i, segment)) {
            return {Kind::Refused, "cannot read file data"};
        }
        if (segment.type == PT_LOAD && isShared && IsCutShort(segment)) {
            return {Kind::Truncated, "file is truncated (a loadable segment lies beyond its end)"};
        }
        loads = loads || segment.type == PT_LOAD;
        hasDynamic = hasDynamic || (segment.type == PT_DYNAMIC && segment.fileSize != 0);
        misaligned = misaligned || (segment.type == PT_LOAD &&
                                    (segment.address - segment.offset) % pageSize != 0);
    }
    if (misaligned) {
        return {Kind::Refused, "ELF load command address/offset not page-aligned"};
    }
    if (!loads) {
        return {Kind::Refused, "object file has no loadable segments"};
    }
    if (!isShared) {
        return {Kind::Refused, "cannot dynamically load executable"};
    }
    if (!hasDynamic) {
        return {Kind::Refused, "object file has no dynamic section"};
    }
    return {};
}

LinkerRefusal Examination::Run() const {
    if (content.size() < boot.HeaderSize()) {
        return {Kind::Refused, "file too short"};
    }
    LinkerRefusal refusal = JudgeIdent();
    if (refusal.kind == Kind::None) {
        refusal = JudgeHeader();
    }
    if (refusal.kind == Kind::None) {
        refusal = JudgeSegments();
    }
    return refusal;
}

}  // namespace

LinkerRefusal AskLinker(const std::string& content, const Architecture& boot) {
    return Examination(content, boot).Run();
}

}  // namespace vantor::analyze
