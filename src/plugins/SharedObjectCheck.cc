#include "plugins/SharedObjectCheck.h"

#include <elf.h>
#include <fcntl.h>
#include <link.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

static_assert(sizeof(off_t) == 8, "a large file would be taken for an unreadable one");

// This program's own header, put there by the linker: what kind of object this process can load.
// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
extern "C" const ElfW(Ehdr) __ehdr_start __attribute__((visibility("hidden")));

// The file's headers, which mostly lie together at its beginning: that much is read at once.
class Headers {
public:
    explicit Headers(int openFile)
        : file(openFile), held(pread(file, beginning.data(), beginning.size(), 0)) {}

    // Copies `size` bytes at `offset`; false when the file does not hold them.
    bool ReadAt(void* buffer, std::size_t size, std::uint64_t offset) const {
        const std::uint64_t end = held < 0 ? 0 : static_cast<std::uint64_t>(held);
        if (size <= end && offset <= end - size) {
            std::memcpy(buffer, beginning.data() + offset, size);
            return true;
        }
        return pread(file, buffer, size, static_cast<off_t>(offset)) == static_cast<ssize_t>(size);
    }

private:
    int file;  // not owned
    std::array<char, 1024> beginning;
    ssize_t held;  // negative when nothing could be read
};

bool HasIdentOfThisProcess(const unsigned char (&ident)[EI_NIDENT]) {
    const unsigned char* const own = __ehdr_start.e_ident;
    if (std::memcmp(ident, own, EI_OSABI) != 0) {  // the magic, word size, byte order and version
        return false;
    }
    const bool plainAbi = ident[EI_OSABI] == ELFOSABI_SYSV && ident[EI_ABIVERSION] == 0;
    if (!plainAbi && ident[EI_OSABI] != ELFOSABI_GNU) {
        return false;
    }
    return std::all_of(ident + EI_PAD, ident + EI_NIDENT,
                       [](unsigned char padding) { return padding == 0; });
}

// The linker refuses every other header in its own words, before it maps anything.
bool IsLoadable(const ElfW(Ehdr) & header) {
    return HasIdentOfThisProcess(header.e_ident) && header.e_type == ET_DYN &&
           header.e_machine == __ehdr_start.e_machine && header.e_version == EV_CURRENT &&
           header.e_phentsize == sizeof(ElfW(Phdr));
}

// A segment without bytes of the file, all zeros, may start anywhere.
bool LiesInside(const ElfW(Phdr) & segment, std::uint64_t fileSize) {
    return segment.p_filesz == 0 ||
           (segment.p_offset <= fileSize && segment.p_filesz <= fileSize - segment.p_offset);
}

bool IsCutShort(const Headers& headers, std::uint64_t fileSize) {
    ElfW(Ehdr) header;
    if (!headers.ReadAt(&header, sizeof header, 0) || !IsLoadable(header)) {
        return false;
    }
    for (std::uint64_t i = 0; i < header.e_phnum; ++i) {
        ElfW(Phdr) segment;
        if (!headers.ReadAt(&segment, sizeof segment, header.e_phoff + i * sizeof segment)) {
            return false;  // the linker cannot read its table either and says so
        }
        if (segment.p_type == PT_LOAD && !LiesInside(segment, fileSize)) {
            return true;
        }
    }
    return false;
}

}  // namespace

std::string ReasonNotToLoad(const std::string& path) {
    // Asked before anything is opened: opening a device can already have an effect.
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || S_ISDIR(status.st_mode)) {
        return {};
    }
    if (!S_ISREG(status.st_mode)) {
        return "not a regular file";
    }
    const FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    if (file.IsOpen() &&
        IsCutShort(Headers(file.Get()), static_cast<std::uint64_t>(status.st_size))) {
        return "file is truncated (a loadable segment lies beyond its end)";
    }
    return {};
}

}  // namespace vantor
