#include "image/SharedObject.h"

#include <algorithm>

namespace vantor::analyze {

namespace {

constexpr std::size_t longestName = 4096;  // of a symbol; real ones are far shorter

// The symbols that dlsym(3) and relocations of other objects find.
bool IsExported(const GElf_Sym& symbol) {
    const unsigned binding = GELF_ST_BIND(symbol.st_info);
    const unsigned type = GELF_ST_TYPE(symbol.st_info);
    const unsigned visibility = GELF_ST_VISIBILITY(symbol.st_other);
    const bool global = binding == STB_GLOBAL || binding == STB_WEAK || binding == STB_GNU_UNIQUE;
    const bool hasAddress = symbol.st_value != 0 || symbol.st_shndx == SHN_ABS || type == STT_TLS;
    const bool dataOrCode = type == STT_NOTYPE || type == STT_OBJECT || type == STT_FUNC ||
                            type == STT_COMMON || type == STT_TLS || type == STT_GNU_IFUNC;
    return global && symbol.st_shndx != SHN_UNDEF && hasAddress && dataOrCode &&
           (visibility == STV_DEFAULT || visibility == STV_PROTECTED);
}

}  // namespace

SharedObject::SharedObject(const ElfFile& elfFile) : file(elfFile) {
    constexpr std::uint64_t symbolicFlag = DF_SYMBOLIC;
    looksInItselfFirst = file.Dynamic(DT_SYMBOLIC).has_value() ||
                         (file.Dynamic(DT_FLAGS).value_or(0) & symbolicFlag) != 0;
    names = file.Bytes(file.Dynamic(DT_STRTAB).value_or(0), file.Dynamic(DT_STRSZ).value_or(0));
    ReadSymbols();
    ReadRelocations(DT_RELA, DT_RELASZ, true);
    ReadRelocations(DT_REL, DT_RELSZ, false);
    ReadRelocations(DT_JMPREL, DT_PLTRELSZ, file.Dynamic(DT_PLTREL) == std::uint64_t{DT_RELA});
    // What the linker applies later holds, so it stays behind.
    std::stable_sort(relocations.begin(), relocations.end(),
                     [](const Relocation& left, const Relocation& right) {
                         return left.address < right.address;
                     });
}

void SharedObject::ReadSymbols() {
    const std::optional<std::uint64_t> table = file.Dynamic(DT_SYMTAB);
    const std::uint64_t symbolCount = table ? CountSymbols() : 0;
    if (symbolCount == 0) {
        return;
    }
    symbols = file.Table(*table, symbolCount, ELF_T_SYM);
    if (symbols == nullptr) {
        throw ElfError("the symbol table lies outside of the file");
    }
    isLookedUp.resize(static_cast<std::size_t>(symbolCount));
    for (std::uint64_t i = 0; i < symbolCount; ++i) {
        GElf_Sym symbol;
        if (gelf_getsym(symbols, static_cast<int>(i), &symbol) != nullptr && IsExported(symbol)) {
            AddExport(symbol, i);
        }
    }
}

void SharedObject::AddExport(const GElf_Sym& symbol, std::uint64_t symbolIndex) {
    const std::string_view name = NameAt(symbol.st_name);
    if (!name.empty()) {
        exports.push_back({name, symbol.st_value, symbol.st_size, VersionEntry(symbolIndex)});
    }
}

// The linker finds symbols through a hash table alone, the GNU one where there are two.
std::uint64_t SharedObject::CountSymbols() const {
    if (const auto hash = file.Dynamic(DT_GNU_HASH)) {
        return CountHashedSymbols(*hash);
    }
    if (const auto hash = file.Dynamic(DT_HASH)) {
        return file.Number(*hash + 4, 4).value_or(0);  // the length of the chains
    }
    return 0;
}

// The last bucket's chain ends with the last symbol.
std::uint64_t SharedObject::CountHashedSymbols(std::uint64_t hash) const {
    const std::uint64_t bucketCount = file.Number(hash, 4).value_or(0);
    const std::uint64_t first = file.Number(hash + 4, 4).value_or(0);
    const std::uint64_t bloomWords = file.Number(hash + 8, 4).value_or(0);
    const std::uint64_t buckets = hash + 16 + bloomWords * file.WordSize();
    if (bucketCount > file.FileSize() / 4) {
        throw ElfError("the symbols' hash table lies outside of the file");
    }
    std::uint64_t last = 0;
    for (std::uint64_t i = 0; i < bucketCount; ++i) {
        last = std::max(last, file.Number(buckets + i * 4, 4).value_or(0));
    }
    if (last < first) {
        return first;  // nothing is exported
    }
    const std::uint64_t chains = buckets + bucketCount * 4;
    while (true) {
        const auto link = file.Number(chains + (last - first) * 4, 4);
        if (!link || last > file.FileSize()) {
            throw ElfError("the symbols' hash table lies outside of the file");
        }
        ++last;
        if ((*link & 1U) != 0) {
            return last;
        }
    }
}

std::string_view SharedObject::NameAt(std::uint64_t offset) const {
    if (offset >= names.size()) {
        return {};
    }
    const std::string_view rest = names.substr(static_cast<std::size_t>(offset), longestName);
    const std::size_t end = rest.find('\0');
    return end == std::string_view::npos ? std::string_view() : rest.substr(0, end);
}

const SharedObject::Symbol* SharedObject::Find(std::string_view name) const {
    const auto found = std::find_if(exports.begin(), exports.end(),
                                    [name](const Symbol& symbol) { return symbol.name == name; });
    return found == exports.end() ? nullptr : &*found;
}

void SharedObject::ReadRelocations(std::int64_t tableTag, std::int64_t sizeTag, bool withAddends) {
    const std::optional<std::uint64_t> table = file.Dynamic(tableTag);
    const std::uint64_t size = file.Dynamic(sizeTag).value_or(0);
    const std::uint64_t count = size / (file.WordSize() * (withAddends ? 3 : 2));
    if (!table || count == 0) {
        return;
    }
    Elf_Data* const data = file.Table(*table, count, withAddends ? ELF_T_RELA : ELF_T_REL);
    if (data == nullptr) {
        throw ElfError("a table of relocations lies outside of the file");
    }
    const bool atLoad = tableTag != DT_JMPREL || BindsAtLoad();
    for (std::uint64_t i = 0; i < count; ++i) {
        GElf_Rela entry{};
        if (withAddends) {
            gelf_getrela(data, static_cast<int>(i), &entry);
        } else {
            GElf_Rel plain{};
            gelf_getrel(data, static_cast<int>(i), &plain);
            entry = {plain.r_offset, plain.r_info, 0};
        }
        relocations.push_back(
            {entry.r_offset, static_cast<std::uint32_t>(GELF_R_TYPE(entry.r_info)),
             static_cast<std::uint32_t>(GELF_R_SYM(entry.r_info)), entry.r_addend, withAddends});
        AddImport(relocations.back().symbol, atLoad);
    }
}

// The table of function calls is read last, so what data refers to too is there already.
void SharedObject::AddImport(std::uint32_t symbolIndex, bool atLoad) {
    if (symbolIndex == 0 || symbolIndex >= isLookedUp.size() || isLookedUp[symbolIndex]) {
        return;
    }
    isLookedUp[symbolIndex] = true;
    GElf_Sym symbol;
    if (gelf_getsym(symbols, static_cast<int>(symbolIndex), &symbol) == nullptr ||
        symbol.st_shndx != SHN_UNDEF || GELF_ST_BIND(symbol.st_info) != STB_GLOBAL) {
        return;
    }
    const std::string_view name = NameAt(symbol.st_name);
    if (!name.empty()) {
        imports.push_back({name, atLoad, VersionEntry(symbolIndex)});
    }
}

// Without a table of versions every symbol is one of the object as a whole.
std::uint16_t SharedObject::VersionEntry(std::uint64_t symbolIndex) const {
    constexpr std::uint64_t ofTheWhole = VER_NDX_GLOBAL;
    const std::optional<std::uint64_t> table = file.Dynamic(DT_VERSYM);
    const std::optional<std::uint64_t> entry =
        table ? file.Number(*table + 2 * symbolIndex, 2) : std::nullopt;
    return static_cast<std::uint16_t>(entry.value_or(ofTheWhole));
}

bool SharedObject::BindsAtLoad() const {
    constexpr std::uint64_t now = DF_BIND_NOW;
    constexpr std::uint64_t nowToo = DF_1_NOW;
    return file.Dynamic(DT_BIND_NOW).has_value() ||
           (file.Dynamic(DT_FLAGS).value_or(0) & now) != 0 ||
           (file.Dynamic(DT_FLAGS_1).value_or(0) & nowToo) != 0;
}

SharedObject::Meaning SharedObject::MeaningOf(std::uint16_t machine, std::uint32_t type) {
    struct Known {
        std::uint16_t machine;
        std::uint32_t type;
        Meaning meaning;
    };
    static constexpr Known known[] = {
        {EM_X86_64, R_X86_64_64, Meaning::Absolute},
        {EM_X86_64, R_X86_64_GLOB_DAT, Meaning::AbsoluteWithoutAddend},
        {EM_X86_64, R_X86_64_JUMP_SLOT, Meaning::AbsoluteWithoutAddend},
        {EM_X86_64, R_X86_64_RELATIVE, Meaning::Relative},
        {EM_X86_64, R_X86_64_IRELATIVE, Meaning::Computed},
        {EM_386, R_386_32, Meaning::Absolute},
        {EM_386, R_386_GLOB_DAT, Meaning::AbsoluteWithoutAddend},
        {EM_386, R_386_JMP_SLOT, Meaning::AbsoluteWithoutAddend},
        {EM_386, R_386_RELATIVE, Meaning::Relative},
        {EM_386, R_386_IRELATIVE, Meaning::Computed},
        {EM_AARCH64, R_AARCH64_ABS64, Meaning::Absolute},
        {EM_AARCH64, R_AARCH64_GLOB_DAT, Meaning::Absolute},
        {EM_AARCH64, R_AARCH64_JUMP_SLOT, Meaning::Absolute},
        {EM_AARCH64, R_AARCH64_RELATIVE, Meaning::Relative},
        {EM_AARCH64, R_AARCH64_IRELATIVE, Meaning::Computed},
        {EM_ARM, R_ARM_ABS32, Meaning::Absolute},
        {EM_ARM, R_ARM_GLOB_DAT, Meaning::AbsoluteWithoutAddend},
        {EM_ARM, R_ARM_JUMP_SLOT, Meaning::AbsoluteWithoutAddend},
        {EM_ARM, R_ARM_RELATIVE, Meaning::Relative},
        {EM_ARM, R_ARM_IRELATIVE, Meaning::Computed},
    };
    if (type == 0) {
        return Meaning::None;  // on each of them
    }
    const auto* const found =
        std::find_if(std::begin(known), std::end(known), [machine, type](const Known& one) {
            return one.machine == machine && one.type == type;
        });
    return found == std::end(known) ? Meaning::Unknown : found->meaning;
}

std::uint64_t SharedObject::Wrapped(std::uint64_t address) const {
    return file.WordSize() == 4 ? address & 0xffffffffU : address;
}

std::optional<LoadedPointer> SharedObject::Pointer(std::uint64_t address) const {
    const std::optional<std::uint64_t> word = file.Number(address, file.WordSize());
    if (!word) {
        return std::nullopt;
    }
    const auto behind = std::upper_bound(
        relocations.begin(), relocations.end(), address,
        [](std::uint64_t value, const Relocation& one) { return value < one.address; });
    const bool found = behind != relocations.begin() && std::prev(behind)->address == address;
    // Behind other relocations, those that a packed table lists too, the word is relative to 0.
    const Relocation relocation = found ? *std::prev(behind) : Relocation{};
    const std::uint64_t addend =
        relocation.hasAddend ? static_cast<std::uint64_t>(relocation.addend) : *word;
    const Meaning meaning = found ? MeaningOf(file.Kind().machine, relocation.type) : Meaning::None;
    switch (meaning) {
    case Meaning::None:
        return LoadedPointer{
            *word == 0 ? LoadedPointer::Kind::Null : LoadedPointer::Kind::Inside, *word, {}};
    case Meaning::Relative:
        return LoadedPointer{LoadedPointer::Kind::Inside, Wrapped(addend), {}};
    case Meaning::Absolute:
        return ToSymbol(relocation, addend);
    case Meaning::AbsoluteWithoutAddend:
        return ToSymbol(relocation, 0);
    case Meaning::Computed:
        return LoadedPointer{LoadedPointer::Kind::Outside, 0, {}};
    case Meaning::Unknown:
        break;
    }
    return std::nullopt;
}

std::optional<LoadedPointer> SharedObject::ToSymbol(const Relocation& relocation,
                                                    std::uint64_t addend) const {
    if (relocation.symbol == 0) {
        return LoadedPointer{addend == 0 ? LoadedPointer::Kind::Null : LoadedPointer::Kind::Inside,
                             Wrapped(addend),
                             {}};
    }
    // Read on its own: no hash table need list it, so it may lie behind those that are counted.
    const std::uint64_t symbolSize = file.WordSize() == 4 ? sizeof(Elf32_Sym) : sizeof(Elf64_Sym);
    Elf_Data* const table = file.Table(
        file.Dynamic(DT_SYMTAB).value_or(0) + relocation.symbol * symbolSize, 1, ELF_T_SYM);
    GElf_Sym symbol;
    if (table == nullptr || gelf_getsym(table, 0, &symbol) == nullptr) {
        return std::nullopt;
    }
    if (symbol.st_shndx == SHN_UNDEF || GELF_ST_TYPE(symbol.st_info) == STT_GNU_IFUNC) {
        return LoadedPointer{LoadedPointer::Kind::Outside, 0, NameAt(symbol.st_name),
                             VersionEntry(relocation.symbol)};
    }
    const bool shared = IsExported(symbol) && !looksInItselfFirst &&
                        GELF_ST_VISIBILITY(symbol.st_other) == STV_DEFAULT;
    return LoadedPointer{LoadedPointer::Kind::Inside, Wrapped(symbol.st_value + addend),
                         shared ? NameAt(symbol.st_name) : std::string_view(),
                         VersionEntry(relocation.symbol)};
}

}  // namespace vantor::analyze
