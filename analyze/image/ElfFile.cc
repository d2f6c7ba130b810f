#include "image/ElfFile.h"

#include <limits.h>

#include <algorithm>

namespace vantor::analyze {

namespace {

[[noreturn]] void ThrowLibraryError(const char* what) {
    const char* const reason = elf_errmsg(-1);
    throw ElfError(std::string(what) + (reason == nullptr ? "" : std::string(": ") + reason));
}

}  // namespace

ElfFile::ElfFile(const std::string& fileContent) : content(fileContent) {
    const std::optional<Architecture> kind = ArchitectureOf(content);
    if (!kind) {
        throw ElfError("no ELF file");
    }
    architecture = *kind;
    if (content.size() < architecture.HeaderSize()) {
        throw ElfError("file too short");
    }
    elf_version(EV_CURRENT);
    // The library takes no constant bytes but writes to none.
    handle.reset(elf_memory(const_cast<char*>(content.data()), content.size()));
    if (handle == nullptr || elf_kind(handle.get()) != ELF_K_ELF) {
        ThrowLibraryError("no ELF file");
    }
    ReadSegments();
}

void ElfFile::ReadSegments() {
    std::size_t count = 0;
    if (elf_getphdrnum(handle.get(), &count) != 0) {
        ThrowLibraryError("the segments cannot be counted");
    }
    std::optional<GElf_Phdr> dynamicHeader;
    for (std::size_t i = 0; i < count; ++i) {
        GElf_Phdr header;
        if (gelf_getphdr(handle.get(), static_cast<int>(i), &header) == nullptr) {
            ThrowLibraryError("a segment's header cannot be read");
        }
        if (header.p_type == PT_DYNAMIC) {
            dynamicHeader = header;
        }
        if (header.p_type == PT_INTERP && header.p_offset < content.size()) {
            const std::string_view rest = std::string_view(content).substr(
                static_cast<std::size_t>(header.p_offset), PATH_MAX);
            interpreter = rest.substr(0, rest.find('\0'));
        }
        if (header.p_type != PT_LOAD || header.p_memsz == 0) {
            continue;
        }
        if (header.p_offset > content.size() ||
            header.p_filesz > content.size() - header.p_offset ||
            header.p_filesz > header.p_memsz || header.p_vaddr + header.p_memsz < header.p_vaddr) {
            throw ElfError("a segment lies outside of the file");
        }
        segments.push_back({header.p_vaddr, header.p_memsz, header.p_offset, header.p_filesz});
    }
    std::stable_sort(
        segments.begin(), segments.end(),
        [](const Segment& left, const Segment& right) { return left.address < right.address; });
    if (dynamicHeader) {
        ReadDynamic(*dynamicHeader);
    }
}

void ElfFile::ReadDynamic(const GElf_Phdr& header) {
    const std::uint64_t count = header.p_filesz / (2 * WordSize());
    Elf_Data* const table = Table(header.p_vaddr, count, ELF_T_DYN);
    if (table == nullptr) {
        throw ElfError("the dynamic section lies outside of the file");
    }
    for (std::uint64_t i = 0; i < count; ++i) {
        GElf_Dyn entry;
        if (gelf_getdyn(table, static_cast<int>(i), &entry) == nullptr || entry.d_tag == DT_NULL) {
            break;
        }
        dynamic[entry.d_tag] = entry.d_un.d_val;
        if (entry.d_tag == DT_NEEDED) {
            needed.push_back(entry.d_un.d_val);
        }
    }
}

const ElfFile::Segment* ElfFile::SegmentAt(std::uint64_t address) const {
    const auto behind = std::upper_bound(
        segments.begin(), segments.end(), address,
        [](std::uint64_t value, const Segment& segment) { return value < segment.address; });
    if (behind == segments.begin()) {
        return nullptr;
    }
    const Segment& segment = *std::prev(behind);
    return address - segment.address < segment.memorySize ? &segment : nullptr;
}

std::optional<std::uint64_t> ElfFile::Number(std::uint64_t address, std::size_t size) const {
    const Segment* const segment = SegmentAt(address);
    if (segment == nullptr || size > segment->memorySize - (address - segment->address)) {
        return std::nullopt;
    }
    unsigned char digits[8] = {};
    const std::string_view held = Bytes(address, size);
    std::copy(held.begin(), held.end(), digits);  // behind them are zeros
    return ElfBytes::Compose(digits, size, architecture.byteOrder == ELFDATA2MSB);
}

std::string_view ElfFile::Bytes(std::uint64_t address, std::uint64_t limit) const {
    const Segment* const segment = SegmentAt(address);
    if (segment == nullptr || address - segment->address >= segment->fileSize) {
        return {};
    }
    const std::uint64_t skipped = address - segment->address;
    const std::uint64_t size = std::min(limit, segment->fileSize - skipped);
    return std::string_view(content).substr(static_cast<std::size_t>(segment->offset + skipped),
                                            static_cast<std::size_t>(size));
}

bool ElfFile::IsZeroFilled(std::uint64_t address) const {
    const Segment* const segment = SegmentAt(address);
    return segment != nullptr && address - segment->address >= segment->fileSize;
}

std::optional<std::uint64_t> ElfFile::Dynamic(std::int64_t tag) const {
    const auto entry = dynamic.find(tag);
    return entry == dynamic.end() ? std::nullopt : std::optional<std::uint64_t>(entry->second);
}

Elf_Data* ElfFile::Table(std::uint64_t address, std::uint64_t count, Elf_Type type) const {
    constexpr std::uint64_t mostEntries = 0x7fffffff;  // the library numbers them with an int
    const std::size_t entrySize = gelf_fsize(handle.get(), type, 1, EV_CURRENT);
    if (entrySize == 0 || count > mostEntries) {
        return nullptr;
    }
    const std::uint64_t size = count * entrySize;
    const std::string_view bytes = Bytes(address, size);
    if (bytes.size() != size || size == 0) {
        return nullptr;
    }
    const auto offset = static_cast<std::int64_t>(bytes.data() - content.data());
    return elf_getdata_rawchunk(handle.get(), offset, bytes.size(), type);
}

}  // namespace vantor::analyze
