#include "io/FileDescriptor.h"

#include <unistd.h>

#include <cerrno>

namespace vantor {

FileDescriptor::~FileDescriptor() {
    const int savedErrno = errno;
    Close();
    errno = savedErrno;
}

int FileDescriptor::Close() {
    if (descriptor < 0) {
        return 0;
    }
    const int closing = descriptor;
    // Linux frees the number even when close() fails: trying again could close another's file.
    descriptor = -1;
    return close(closing);
}

}  // namespace vantor
