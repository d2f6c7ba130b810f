#include "plugins/TerminalCalls.h"

#include <fcntl.h>
#include <linux/vt.h>
#include <poll.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>

namespace vantor::support {

namespace {

TerminalCalls* current = nullptr;

}  // namespace

TerminalCalls::TerminalCalls() { current = this; }

TerminalCalls::~TerminalCalls() { current = nullptr; }

DescriptorReplacement::DescriptorReplacement(int number, int replacement)
    : replaced(number), saved(fcntl(number, F_DUPFD_CLOEXEC, 3)) {
    std::fflush(stdout);
    dup2(replacement, number);
}

DescriptorReplacement::~DescriptorReplacement() {
    std::fflush(stdout);
    if (saved < 0) {
        close(replaced);
        return;
    }
    dup2(saved, replaced);
    close(saved);
}

}  // namespace vantor::support

using vantor::support::current;

extern "C" {

int __real_ioctl(int descriptor, unsigned long request, ...);
int __real_poll(pollfd* descriptors, nfds_t count, int milliseconds);
ssize_t __real_read(int descriptor, void* buffer, size_t size);

int __wrap_ioctl(int descriptor, unsigned long request, ...) {
    va_list rest;
    va_start(rest, request);
    const long argument = va_arg(rest, long);
    va_end(rest);
    if (request != VT_ACTIVATE && request != VT_WAITACTIVE) {
        return __real_ioctl(descriptor, request, argument);
    }
    if (current == nullptr) {
        return 0;
    }
    current->requests.emplace_back(request, static_cast<int>(argument));
    return request == VT_ACTIVATE && current->activate.Fails() ? -1 : 0;
}

int __wrap_poll(pollfd* descriptors, nfds_t count, int milliseconds) {
    if (count == 0 && current != nullptr && current->onPause) {
        current->onPause();
        return 0;
    }
    return __real_poll(descriptors, count, milliseconds);
}

ssize_t __wrap_read(int descriptor, void* buffer, size_t size) {
    if (descriptor == STDIN_FILENO && current != nullptr && current->beforeRead) {
        current->beforeRead();
    }
    return __real_read(descriptor, buffer, size);
}

}  // extern "C"
