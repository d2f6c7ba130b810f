#include "image/Architecture.h"

#include <elf.h>

#include <cstring>

#include "image/ImageFile.h"

namespace vantor::analyze {

namespace {

std::string MachineName(std::uint16_t machine) {
    switch (machine) {
    case EM_386:
        return "Intel 80386";
    case EM_X86_64:
        return "x86-64";
    case EM_ARM:
        return "ARM";
    case EM_AARCH64:
        return "AArch64";
    default:
        return "machine " + std::to_string(machine);
    }
}

}  // namespace

std::size_t Architecture::WordSize() const { return wordClass == ELFCLASS32 ? 4 : 8; }

std::size_t Architecture::HeaderSize() const {
    return wordClass == ELFCLASS32 ? sizeof(Elf32_Ehdr) : sizeof(Elf64_Ehdr);
}

std::size_t Architecture::SegmentHeaderSize() const {
    return wordClass == ELFCLASS32 ? sizeof(Elf32_Phdr) : sizeof(Elf64_Phdr);
}

std::uint32_t Architecture::Key() const {
    return static_cast<std::uint32_t>(wordClass) << 24U |
           static_cast<std::uint32_t>(byteOrder) << 16U | machine;
}

std::string Architecture::Text() const {
    return std::string(wordClass == ELFCLASS32 ? "32" : "64") + "-bit " + MachineName(machine) +
           (byteOrder == ELFDATA2MSB ? ", big-endian" : "");
}

std::optional<Architecture> ArchitectureOf(std::string_view content) {
    if (content.size() < architectureBytes || std::memcmp(content.data(), ELFMAG, SELFMAG) != 0) {
        return std::nullopt;
    }
    const auto byteAt = [content](std::size_t at) {
        return static_cast<unsigned char>(content[at]);
    };
    Architecture result;
    result.wordClass = byteAt(EI_CLASS);
    result.byteOrder = byteAt(EI_DATA);
    if ((result.wordClass != ELFCLASS32 && result.wordClass != ELFCLASS64) ||
        (result.byteOrder != ELFDATA2LSB && result.byteOrder != ELFDATA2MSB)) {
        return std::nullopt;
    }
    constexpr std::size_t machineOffset = EI_NIDENT + 2;  // behind the ident and the type
    const unsigned first = byteAt(machineOffset);
    const unsigned second = byteAt(machineOffset + 1);
    result.machine = static_cast<std::uint16_t>(
        result.byteOrder == ELFDATA2LSB ? second << 8U | first : first << 8U | second);
    return result;
}

std::optional<Architecture> ArchitectureVote::Winner() const {
    std::optional<Architecture> winner;
    std::size_t most = 0;
    for (const auto& [architecture, count] : votes) {
        if (count > most) {
            winner = architecture;
            most = count;
        }
    }
    return winner;
}

std::optional<Architecture> ProgramArchitecture(const HostImage& image) {
    return ArchitectureOf(ReadImageFile(image, HostImage::program, architectureBytes).content);
}

}  // namespace vantor::analyze
