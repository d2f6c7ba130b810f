#include "basekit/Descriptor.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace BaseKit::impl {

Descriptor& Descriptor::operator=(Descriptor&& other) noexcept {
    if (this != &other) {
        Close();
        number = std::exchange(other.number, -1);
    }
    return *this;
}

void Descriptor::Close() {
    if (number >= 0) {
        const int savedErrno = errno;
        close(std::exchange(number, -1));
        errno = savedErrno;
    }
}

Descriptor AboveStandard(Descriptor opened) {
    if (!opened.IsOpen() || opened.Get() > STDERR_FILENO) {
        return opened;
    }
    return Descriptor(fcntl(opened.Get(), F_DUPFD_CLOEXEC, STDERR_FILENO + 1));
}

int OpenPipe(Descriptor& readEnd, Descriptor& writeEnd) {
    int ends[2] = {-1, -1};
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return errno;
    }
    Descriptor reading(ends[0]);
    Descriptor writing(ends[1]);
    readEnd = AboveStandard(std::move(reading));
    if (!readEnd.IsOpen() || fcntl(readEnd.Get(), F_SETFL, O_NONBLOCK) != 0) {
        return errno;
    }
    writeEnd = AboveStandard(std::move(writing));
    return writeEnd.IsOpen() ? 0 : errno;
}

int OpenNullDevice(Descriptor& opened) {
    opened = AboveStandard(Descriptor(open(nullDevice, O_RDONLY | O_CLOEXEC)));
    return opened.IsOpen() ? 0 : errno;
}

}  // namespace BaseKit::impl
