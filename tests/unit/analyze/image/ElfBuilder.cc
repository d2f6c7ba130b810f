#include "analyze/image/ElfBuilder.h"

#include <elf.h>

namespace vantor::support {

using analyze::Architecture;

const Architecture x86{ELFCLASS32, ELFDATA2LSB, EM_386};
const Architecture x86With64Bits{ELFCLASS64, ELFDATA2LSB, EM_X86_64};
const Architecture arm{ELFCLASS32, ELFDATA2LSB, EM_ARM};
const Architecture armWith64Bits{ELFCLASS64, ELFDATA2LSB, EM_AARCH64};

namespace {

constexpr std::uint64_t loadAddress = 0x20000;  // the address of the file's first byte
constexpr std::uint64_t tailAddress = 0x100000;
constexpr std::uint64_t pageSize = 4096;
constexpr std::size_t segmentCount = 3;

std::uint64_t RelativeType(std::uint16_t machine) {
    switch (machine) {
    case EM_386:
        return R_386_RELATIVE;
    case EM_ARM:
        return R_ARM_RELATIVE;
    case EM_AARCH64:
        return R_AARCH64_RELATIVE;
    default:
        return R_X86_64_RELATIVE;
    }
}

std::uint64_t AbsoluteType(std::uint16_t machine) {
    switch (machine) {
    case EM_386:
        return R_386_32;
    case EM_ARM:
        return R_ARM_ABS32;
    case EM_AARCH64:
        return R_AARCH64_ABS64;
    default:
        return R_X86_64_64;
    }
}

}  // namespace

ElfBuilder::ElfBuilder(const Architecture& kind)
    : architecture(kind),
      word(kind.WordSize()),
      content(kind.HeaderSize() + segmentCount * kind.SegmentHeaderSize(), '\0') {}

bool ElfBuilder::HasAddends() const {
    return architecture.machine != EM_386 && architecture.machine != EM_ARM;
}

std::uint64_t ElfBuilder::Align() {
    content.resize((content.size() + 7) / 8 * 8);
    return content.size();
}

void ElfBuilder::Put(std::string& file, std::uint64_t offset, std::uint64_t number,
                     std::size_t size, bool bigEndian) {
    for (std::size_t i = 0; i < size; ++i) {
        const std::size_t place = bigEndian ? size - 1 - i : i;
        file.at(static_cast<std::size_t>(offset) + place) =
            static_cast<char>(number >> (8 * i) & 0xffU);
    }
}

void ElfBuilder::PutWord(std::string& file, std::uint64_t offset, std::uint64_t value) const {
    Put(file, offset, value, word, architecture.byteOrder == ELFDATA2MSB);
}

void ElfBuilder::AppendWord(std::string& file, std::uint64_t value) const {
    file.resize(file.size() + word);
    PutWord(file, file.size() - word, value);
}

std::uint64_t ElfBuilder::Bytes(const std::string& bytes) {
    content += bytes;
    return loadAddress + content.size() - bytes.size();
}

std::string ElfBuilder::Encode(const std::vector<Word>& words, std::uint64_t address) {
    std::string bytes;
    for (const Word& one : words) {
        if (one.how != Word::How::Plain) {
            relocations.push_back({address + bytes.size(), one});
        }
        const bool inPlace = one.how == Word::How::Plain || !HasAddends();
        AppendWord(bytes, inPlace ? one.value : 0);
    }
    return bytes;
}

std::uint64_t ElfBuilder::Words(const std::vector<Word>& words) {
    const std::uint64_t address = loadAddress + Align();
    content += Encode(words, address);
    return address;
}

std::uint64_t ElfBuilder::WordsAtTheEnd(const std::vector<Word>& words) {
    tail = Encode(words, tailAddress);
    return tailAddress;
}

std::uint64_t ElfBuilder::Names(const std::vector<std::string>& names) {
    std::vector<Word> words;
    words.reserve(names.size() + 1);
    for (const std::string& name : names) {
        words.push_back(To(Text(name)));
    }
    words.push_back(Null());
    return Words(words);
}

std::uint64_t ElfBuilder::IndexOf(const std::string& symbol) const {
    std::uint64_t index = 1;
    for (const Symbol& one : symbols) {
        if (one.name == symbol) {
            return index;
        }
        ++index;
    }
    return 0;
}

std::string ElfBuilder::SymbolTable(std::string& names) const {
    const bool big = architecture.byteOrder == ELFDATA2MSB;
    const std::size_t size = word == 4 ? sizeof(Elf32_Sym) : sizeof(Elf64_Sym);
    std::string table(size * (symbols.size() + 1), '\0');
    std::size_t at = size;
    names.assign(1, '\0');
    for (const Symbol& symbol : symbols) {
        const std::size_t info =
            word == 4 ? offsetof(Elf32_Sym, st_info) : offsetof(Elf64_Sym, st_info);
        const std::size_t value =
            word == 4 ? offsetof(Elf32_Sym, st_value) : offsetof(Elf64_Sym, st_value);
        Put(table, at, names.size(), 4, big);
        Put(table, at + value, symbol.address, word, big);
        Put(table, at + value + word, symbol.size, word, big);
        Put(table, at + info, ELF64_ST_INFO(STB_GLOBAL, STT_OBJECT), 1);
        Put(table, at + info + 1, symbol.visibility, 1);
        Put(table, at + info + 2, symbol.address == 0 ? SHN_UNDEF : 1, 2, big);
        names += symbol.name + '\0';
        at += size;
    }
    return table;
}

// One bucket, whose chain holds every symbol.
std::string ElfBuilder::HashTable() const {
    const bool big = architecture.byteOrder == ELFDATA2MSB;
    const std::size_t count = symbols.size() + 1;
    std::string table(4 * (3 + count), '\0');
    Put(table, 0, 1, 4, big);
    Put(table, 4, count, 4, big);
    Put(table, 8, symbols.empty() ? 0 : 1, 4, big);
    for (std::size_t i = 1; i + 1 < count; ++i) {
        Put(table, 4 * (3 + i), i + 1, 4, big);
    }
    return table;
}

std::string ElfBuilder::RelocationTable() const {
    std::string table;
    for (const Relocation& one : relocations) {
        const bool symbolic = one.word.how == Word::How::Symbolic;
        const std::uint64_t type =
            symbolic ? AbsoluteType(architecture.machine) : RelativeType(architecture.machine);
        const std::uint64_t symbol = symbolic ? IndexOf(one.word.symbol) : 0;
        AppendWord(table, one.address);
        AppendWord(table, word == 4 ? symbol << 8U | type : symbol << 32U | type);
        if (HasAddends()) {
            AppendWord(table, one.word.value);
        }
    }
    return table;
}

void ElfBuilder::PutHeaders(std::string& file, std::uint64_t dynamicOffset,
                            std::uint64_t end) const {
    const bool big = architecture.byteOrder == ELFDATA2MSB;
    file.replace(0, SELFMAG, ELFMAG);
    Put(file, EI_CLASS, architecture.wordClass, 1);
    Put(file, EI_DATA, architecture.byteOrder, 1);
    Put(file, EI_VERSION, EV_CURRENT, 1);
    std::uint64_t at = EI_NIDENT;
    const auto put = [&file, &at, big](std::uint64_t number, std::size_t size) {
        Put(file, at, number, size, big);
        at += size;
    };
    put(ET_DYN, 2);
    put(architecture.machine, 2);
    put(EV_CURRENT, 4);
    put(0, word);                          // entry point
    put(architecture.HeaderSize(), word);  // segments
    put(0, word);                          // sections
    put(0, 4);                             // flags
    put(architecture.HeaderSize(), 2);
    put(architecture.SegmentHeaderSize(), 2);
    put(segmentCount, 2);
    put(0, 6);
    const auto segment = [&](std::uint64_t type, std::uint64_t offset, std::uint64_t address,
                             std::uint64_t size) {
        put(type, 4);
        if (word == 8) {
            put(PF_R | PF_W, 4);
        }
        put(offset, word);
        put(address, word);
        put(address, word);
        put(size, word);
        put(size, word);
        if (word == 4) {
            put(PF_R | PF_W, 4);
        }
        put(pageSize, word);
    };
    segment(PT_LOAD, 0, loadAddress, end);
    segment(PT_DYNAMIC, dynamicOffset, loadAddress + dynamicOffset, end - dynamicOffset);
    segment(tail.empty() ? PT_NULL : PT_LOAD, file.size() - tail.size(), tailAddress, tail.size());
}

std::string ElfBuilder::Finish() const {
    std::string file = content;
    std::string names;
    const auto append = [&file](const std::string& table) {
        file.resize((file.size() + 7) / 8 * 8);
        file += table;
        return loadAddress + file.size() - table.size();
    };
    const std::string relocationTable = RelocationTable();
    std::vector<Entry> entries = dynamic;
    entries.push_back({DT_SYMTAB, append(SymbolTable(names))});
    for (const TextEntry& entry : dynamicTexts) {
        entries.push_back({entry.tag, names.size()});
        names += entry.text + '\0';
    }
    entries.push_back({DT_STRTAB, append(names)});
    entries.push_back({DT_STRSZ, names.size()});
    entries.push_back({DT_HASH, append(HashTable())});
    entries.push_back({HasAddends() ? std::uint64_t{DT_RELA} : DT_REL, append(relocationTable)});
    entries.push_back({HasAddends() ? std::uint64_t{DT_RELASZ} : DT_RELSZ, relocationTable.size()});
    // The linker takes for granted that these are there, and right.
    entries.push_back({DT_SYMENT, word == 4 ? sizeof(Elf32_Sym) : sizeof(Elf64_Sym)});
    entries.push_back(
        {HasAddends() ? std::uint64_t{DT_RELAENT} : DT_RELENT, word * (HasAddends() ? 3 : 2)});
    entries.push_back({DT_NULL, 0});
    std::string section;
    for (const Entry& entry : entries) {
        AppendWord(section, entry.tag);
        AppendWord(section, entry.value);
    }
    const std::uint64_t dynamicOffset = append(section) - loadAddress;
    const std::uint64_t end = file.size();
    if (!tail.empty()) {
        file.resize(static_cast<std::size_t>((end + pageSize - 1) / pageSize * pageSize));
        file += tail;
    }
    PutHeaders(file, dynamicOffset, end);
    return file;
}

void PluginRecords::AddTo(ElfBuilder& builder) const {
    const std::uint64_t metadata =
        builder.Words({{static_cast<std::uint32_t>(version), ElfBuilder::Word::How::Plain, {}},
                       required,
                       provided,
                       pluginVersion,
                       {runOnce, ElfBuilder::Word::How::Plain, {}},
                       requiredFlags,
                       disablingFlags});
    builder.Add({"metadata", metadata});
    builder.Add({"operations", builder.Words({start, applyHostProfile})});
}

}  // namespace vantor::support
