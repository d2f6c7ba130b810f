#include "plugins/SharedObjectCheck.h"

#include <elf.h>
#include <fcntl.h>
#include <link.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdint>
#include <cstring>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

constexpr unsigned char wordClass = sizeof(void*) == 4 ? ELFCLASS32 : ELFCLASS64;

// Reads `size` bytes at `offset`; false when the file does not hold them.
bool ReadAt(int file, void* buffer, std::size_t size, std::uint64_t offset) {
    return pread(file, buffer, size, static_cast<off_t>(offset)) == static_cast<ssize_t>(size);
}

// The linker refuses other headers before it maps anything.
bool IsLoadable(const ElfW(Ehdr) & header) {
    return std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0 &&
           header.e_ident[EI_CLASS] == wordClass && header.e_phentsize == sizeof(ElfW(Phdr));
}

bool LiesInside(const ElfW(Phdr) & segment, std::uint64_t fileSize) {
    return segment.p_offset <= fileSize && segment.p_filesz <= fileSize - segment.p_offset;
}

bool IsCutShort(int file, std::uint64_t fileSize) {
    ElfW(Ehdr) header;
    if (!ReadAt(file, &header, sizeof header, 0) || !IsLoadable(header)) {
        return false;
    }
    for (std::uint64_t i = 0; i < header.e_phnum; ++i) {
        ElfW(Phdr) segment;
        if (!ReadAt(file, &segment, sizeof segment, header.e_phoff + i * sizeof segment)) {
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
    // O_PATH names the file without opening it: opening a device can already have an effect.
    const FileDescriptor location(open(path.c_str(), O_PATH | O_CLOEXEC));
    struct stat status {};
    if (!location.IsOpen() || fstat(location.Get(), &status) != 0 || S_ISDIR(status.st_mode)) {
        return {};
    }
    if (!S_ISREG(status.st_mode)) {
        return "not a regular file";
    }
    const FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    if (file.IsOpen() && IsCutShort(file.Get(), static_cast<std::uint64_t>(status.st_size))) {
        return "file is truncated (a loadable segment lies beyond its end)";
    }
    return {};
}

}  // namespace vantor
