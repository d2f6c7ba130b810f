#ifndef VANTOR_IO_CLOSEDESCRIPTORS_H
#define VANTOR_IO_CLOSEDESCRIPTORS_H

#include <array>
#include <cstddef>

namespace vantor {

// The descriptors that a child keeps when it closes all others. Holds no heap memory, so that it
// can be made before a fork and read after it.
struct KeptDescriptors {
    std::array<int, 8> numbers{};
    std::size_t count = 0;

    // Adds one; a negative number (no descriptor) is left out. At most 8 in all.
    void Add(int descriptor);
    bool Contains(int descriptor) const;
};

// The process's open-file limit: descriptor numbers below it can be in use. Never negative; without
// a limit, the largest int.
int OpenFileLimit();

// Closes every descriptor from `first` up to `limit` - 1 but the kept ones. Async-signal-safe: for
// use between fork and exec. Takes time in proportion to what is open, not to the limit, which
// can be a thousand million: by close_range(2), or by the list in /proc/self/fd on a kernel
// without it; where neither answers it tries every number.
void CloseDescriptors(int first, int limit, const KeptDescriptors& kept);

}  // namespace vantor

#endif
