#include "io/CloseDescriptors.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdint>
#include <cstring>
#include <limits>

namespace vantor {

namespace {

// The kernel's own record, getdents64(2): the C library's readdir allocates memory, which a child
// of a process with threads must not do.
struct DirectoryRecordHeader {
    std::uint64_t inode;
    std::int64_t offset;
    std::uint16_t length;
    std::uint8_t type;
};
constexpr std::size_t recordNameOffset = 19;

bool CloseRange(int first, int last) {
    return syscall(SYS_close_range, static_cast<unsigned>(first), static_cast<unsigned>(last),
                   0U) == 0;
}

// The smallest kept number that is at least `from`, or `none`.
int NextKept(const KeptDescriptors& kept, int from, int none) {
    int next = none;
    for (std::size_t i = 0; i < kept.count; ++i) {
        if (kept.numbers[i] >= from && kept.numbers[i] < next) {
            next = kept.numbers[i];
        }
    }
    return next;
}

bool CloseByRanges(int first, int limit, const KeptDescriptors& kept) {
    int from = first;
    while (from < limit) {
        const int next = NextKept(kept, from, limit);
        if (next > from && !CloseRange(from, next - 1)) {
            return false;
        }
        if (next == limit) {
            break;
        }
        from = next + 1;
    }
    return true;
}

// The number that `name` spells in decimal, or -1.
int ParseDescriptor(const char* name) {
    if (*name == '\0') {
        return -1;
    }
    std::int64_t number = 0;
    for (; *name != '\0'; ++name) {
        if (*name < '0' || *name > '9') {
            return -1;
        }
        number = number * 10 + (*name - '0');
        if (number > std::numeric_limits<int>::max()) {
            return -1;
        }
    }
    return static_cast<int>(number);
}

bool CloseByList(int first, int limit, const KeptDescriptors& kept) {
    const int list = open("/proc/self/fd", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (list < 0) {
        return false;
    }
    alignas(DirectoryRecordHeader) char buffer[4096];
    long size = 0;
    // The listing goes by ascending number, so closing what was listed does not disturb it.
    while ((size = syscall(SYS_getdents64, list, buffer, sizeof buffer)) > 0) {
        for (std::size_t at = 0; at < static_cast<std::size_t>(size);) {
            DirectoryRecordHeader header;
            std::memcpy(&header, buffer + at, sizeof header);
            const int descriptor = ParseDescriptor(buffer + at + recordNameOffset);
            if (descriptor >= first && descriptor < limit && descriptor != list &&
                !kept.Contains(descriptor)) {
                close(descriptor);
            }
            at += header.length;
        }
    }
    close(list);
    return size == 0;
}

}  // namespace

void KeptDescriptors::Add(int descriptor) {
    if (descriptor >= 0 && count < numbers.size()) {
        numbers[count] = descriptor;
        ++count;
    }
}

bool KeptDescriptors::Contains(int descriptor) const {
    for (std::size_t i = 0; i < count; ++i) {
        if (numbers[i] == descriptor) {
            return true;
        }
    }
    return false;
}

int OpenFileLimit() {
    const long limit = sysconf(_SC_OPEN_MAX);
    if (limit < 0 || limit > std::numeric_limits<int>::max()) {
        return std::numeric_limits<int>::max();
    }
    return static_cast<int>(limit);
}

void CloseDescriptors(int first, int limit, const KeptDescriptors& kept) {
    if (CloseByRanges(first, limit, kept) || CloseByList(first, limit, kept)) {
        return;
    }
    for (int descriptor = first; descriptor < limit; ++descriptor) {
        if (!kept.Contains(descriptor)) {
            close(descriptor);
        }
    }
}

}  // namespace vantor
