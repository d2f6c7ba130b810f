#include "io/IoFaults.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/types.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>
#include <new>

namespace vantor::support {

void IoFaults::Reset() {
    for (FaultPoint* fault :
         {&mkstemp, &rename, &stat, &chmod, &fsync, &unlink, &open, &close, &snprintf, &allocation,
          &fork, &pipe2, &setsid, &waitpid, &read, &closeRange, &listFolder, &sysconf}) {
        fault->Reset();
    }
}

IoFaults& Faults() {
    // Never destroyed: the wrapped calls are made until the very end.
    static auto* const faults = new IoFaults;
    return *faults;
}

}  // namespace vantor::support

using vantor::support::Faults;

extern "C" {

int __real_mkstemp(char* pattern);
int __real_rename(const char* from, const char* to);
int __real_stat(const char* path, struct stat* status);
int __real_chmod(const char* path, mode_t mode);
int __real_fsync(int descriptor);
int __real_unlink(const char* path);
int __real_open(const char* path, int flags, ...);
int __real_close(int descriptor);
pid_t __real_fork();
int __real_pipe2(int* ends, int flags);
pid_t __real_setsid();
pid_t __real_waitpid(pid_t child, int* status, int options);
ssize_t __real_read(int descriptor, void* buffer, size_t size);
long __real_syscall(long number, ...);
long __real_sysconf(int name);

int __wrap_mkstemp(char* pattern) {
    return Faults().mkstemp.Fails() ? -1 : __real_mkstemp(pattern);
}

int __wrap_rename(const char* from, const char* to) {
    return Faults().rename.Fails() ? -1 : __real_rename(from, to);
}

int __wrap_stat(const char* path, struct stat* status) {
    return Faults().stat.Fails() ? -1 : __real_stat(path, status);
}

int __wrap_chmod(const char* path, mode_t mode) {
    return Faults().chmod.Fails() ? -1 : __real_chmod(path, mode);
}

int __wrap_fsync(int descriptor) { return Faults().fsync.Fails() ? -1 : __real_fsync(descriptor); }

int __wrap_unlink(const char* path) { return Faults().unlink.Fails() ? -1 : __real_unlink(path); }

int __wrap_open(const char* path, int flags, ...) {
    mode_t mode = 0;
    if ((flags & O_CREAT) != 0) {
        va_list rest;
        va_start(rest, flags);
        mode = va_arg(rest, mode_t);
        va_end(rest);
    }
    return Faults().open.Fails() ? -1 : __real_open(path, flags, mode);
}

int __wrap_close(int descriptor) { return Faults().close.Fails() ? -1 : __real_close(descriptor); }

// Only as far as the tests of io/ need it: when it is to fail it reports one character too few.
__attribute__((format(printf, 3, 4))) int __wrap_snprintf(char* buffer, size_t size,
                                                          const char* format, ...) {
    va_list rest;
    va_start(rest, format);
    const int length = vsnprintf(buffer, size, format, rest);
    va_end(rest);
    return Faults().snprintf.Fails() ? length - 1 : length;
}

// What a build with _FORTIFY_SOURCE calls in its place.
__attribute__((format(printf, 5, 6))) int __wrap___snprintf_chk(char* buffer, size_t size, int,
                                                                size_t, const char* format, ...) {
    va_list rest;
    va_start(rest, format);
    const int length = vsnprintf(buffer, size, format, rest);
    va_end(rest);
    return Faults().snprintf.Fails() ? length - 1 : length;
}

pid_t __wrap_fork() { return Faults().fork.Fails() ? -1 : __real_fork(); }

int __wrap_pipe2(int* ends, int flags) {
    return Faults().pipe2.Fails() ? -1 : __real_pipe2(ends, flags);
}

pid_t __wrap_setsid() { return Faults().setsid.Fails() ? -1 : __real_setsid(); }

pid_t __wrap_waitpid(pid_t child, int* status, int options) {
    return Faults().waitpid.Fails() ? -1 : __real_waitpid(child, status, options);
}

ssize_t __wrap_read(int descriptor, void* buffer, size_t size) {
    return Faults().read.Fails() ? -1 : __real_read(descriptor, buffer, size);
}

// Three arguments are what every system call has that is made this way here.
long __wrap_syscall(long number, ...) {
    va_list rest;
    va_start(rest, number);
    const long first = va_arg(rest, long);
    const long second = va_arg(rest, long);
    const long third = va_arg(rest, long);
    va_end(rest);
    if ((number == SYS_close_range && Faults().closeRange.Fails()) ||
        (number == SYS_getdents64 && Faults().listFolder.Fails())) {
        return -1;
    }
    return __real_syscall(number, first, second, third);
}

long __wrap_sysconf(int name) { return Faults().sysconf.Fails() ? -1 : __real_sysconf(name); }

// operator new[](std::size_t, const std::nothrow_t&), by its name on a 64-bit and a 32-bit machine.
#if defined(__LP64__)
#define NOTHROW_ARRAY_NEW(prefix) prefix##_ZnamRKSt9nothrow_t
#else
#define NOTHROW_ARRAY_NEW(prefix) prefix##_ZnajRKSt9nothrow_t
#endif

void* NOTHROW_ARRAY_NEW(__real_)(size_t size, const std::nothrow_t& tag);

void* NOTHROW_ARRAY_NEW(__wrap_)(size_t size, const std::nothrow_t& tag) {
    return Faults().allocation.Fails() ? nullptr : NOTHROW_ARRAY_NEW(__real_)(size, tag);
}

}  // extern "C"
