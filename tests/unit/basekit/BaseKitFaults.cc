#include "basekit/BaseKitFaults.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdlib>

namespace vantor::support {

void BaseKitFaults::Reset() {
    for (FaultPoint* point : {&open, &pipe2, &read, &readdir, &pidfdOpen}) {
        point->Reset();
    }
}

BaseKitFaults& Faults() {
    static BaseKitFaults faults;
    return faults;
}

}  // namespace vantor::support

extern "C" {

using vantor::support::Faults;

int __real_open(const char* path, int flags, ...);
int __real_pipe2(int* ends, int flags);
ssize_t __real_read(int descriptor, void* buffer, size_t size);
ssize_t __real___read_chk(int descriptor, void* buffer, size_t size, size_t limit);
dirent* __real_readdir(DIR* directory);
long __real_syscall(long number, ...);

int __wrap_open(const char* path, int flags, ...) {
    va_list rest;
    va_start(rest, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(rest, mode_t) : 0;
    va_end(rest);
    return Faults().open.Fails() ? -1 : __real_open(path, flags, mode);
}

int __wrap_pipe2(int* ends, int flags) {
    return Faults().pipe2.Fails() ? -1 : __real_pipe2(ends, flags);
}

ssize_t __wrap_read(int descriptor, void* buffer, size_t size) {
    return Faults().read.Fails() ? -1 : __real_read(descriptor, buffer, size);
}

// What read() becomes in a fortified build.
ssize_t __wrap___read_chk(int descriptor, void* buffer, size_t size, size_t limit) {
    return Faults().read.Fails() ? -1 : __real___read_chk(descriptor, buffer, size, limit);
}

dirent* __wrap_readdir(DIR* directory) {
    return Faults().readdir.Fails() ? nullptr : __real_readdir(directory);
}

// The library makes one system call this way.
long __wrap_syscall(long number, ...) {
    va_list rest;
    va_start(rest, number);
    const pid_t process = va_arg(rest, pid_t);
    const int flags = va_arg(rest, int);
    va_end(rest);
    if (number != SYS_pidfd_open) {
        std::abort();
    }
    return Faults().pidfdOpen.Fails() ? -1 : __real_syscall(number, process, flags);
}

}  // extern "C"
