#include "io/afstream.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>
#include <stdexcept>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

constexpr const char* temporarySuffix = ".XXXXXX";
constexpr std::size_t temporarySuffixLength = 7;

// Throws with errno set to `error`, which building the text may have changed.
[[noreturn]] void Throw(const std::string& text, int error) {
    const std::runtime_error exception(text + std::strerror(error));
    errno = error;
    throw exception;
}

// Creates the temporary file for `path` and returns its name.
std::string CreateTemporary(const char* path) {
    const std::size_t pathLength = std::strlen(path);
    const std::size_t size = pathLength + temporarySuffixLength + 1;
    const std::unique_ptr<char[]> name(new (std::nothrow) char[size]());
    if (name == nullptr) {
        throw std::runtime_error("insufficient memory to allocate buffer");
    }
    const int length = std::snprintf(name.get(), size, "%s%s", path, temporarySuffix);
    if (length < 0 || static_cast<std::size_t>(length) != size - 1) {
        throw std::runtime_error("unable to allocate mkstemp pattern");
    }
    std::string created;
    created.reserve(size);  // once the file exists, nothing may fail before its name is known
    FileDescriptor file(mkstemp(name.get()));
    if (!file.IsOpen()) {
        const int error = errno;
        Throw("unable to create temporary file to write '" + std::string(path) + "': ", error);
    }
    file.Close();
    created = name.get();
    return created;
}

}  // namespace

afstream::~afstream() { Discard(); }

void afstream::open(const char* path, std::ios_base::openmode mode) {
    Discard();
    tempName.clear();
    destName.clear();

    std::string destination = path;
    tempName = CreateTemporary(path);
    destName = std::move(destination);
    if (rdbuf()->open(tempName.c_str(), mode | std::ios_base::out) != nullptr) {
        clear();
    } else {
        setstate(std::ios_base::failbit);
    }
    if (rdstate() != std::ios_base::goodbit) {
        const int error = errno;
        Throw("failed to create temp file: ", error);
    }
}

void afstream::commit() {
    if (tempName.empty() || destName.empty()) {
        throw std::runtime_error("commit invoked on an unknown destination");
    }
    FlushToDisk();
    // All content is on the disk by now, so that a failed close has nothing left to lose.
    if (rdbuf()->close() == nullptr) {
        setstate(std::ios_base::failbit);
    }

    struct stat old {};
    std::string permissionError;
    errno = 0;
    const bool existed = stat(destName.c_str(), &old) == 0;
    if (!existed && errno != ENOENT) {
        permissionError = std::strerror(errno);
    }
    if (rename(tempName.c_str(), destName.c_str()) != 0) {
        const int error = errno;
        Throw("unable to rename '" + tempName + "' to '" + destName + "': ", error);
    }
    if (existed && chmod(destName.c_str(), old.st_mode & 07777U) != 0) {
        permissionError = std::strerror(errno);
    }
    if (!permissionError.empty()) {
        throw std::runtime_error(
            "failed to restore file permissions, file permissions may be incorrect: " +
            permissionError);
    }
}

// Puts the whole content on the disk or discards the temporary file and throws: a rename after
// that could replace a good file by a torn one, at once or after a power cut.
void afstream::FlushToDisk() {
    // What the buffer still holds is tried again even after an earlier failure, to learn its cause.
    const bool intact = good();
    errno = 0;
    const bool flushed = rdbuf()->pubsync() == 0;
    const int writeError = errno;
    if (!intact || !flushed) {
        Discard();
        Throw("unable to write '" + tempName + "': ", writeError != 0 ? writeError : EIO);
    }
    // The stream does not give its descriptor away; any descriptor of the file synchronises it.
    FileDescriptor file(::open(tempName.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
    if (!file.IsOpen() && errno == ENOENT) {
        return;  // nothing to synchronise: already committed, or taken away; the rename says so
    }
    if (!file.IsOpen() || fsync(file.Get()) != 0) {
        const int syncError = errno;
        Discard();
        Throw("unable to synchronise '" + tempName + "' to disk: ", syncError);
    }
}

void afstream::Discard() noexcept {
    if (tempName.empty()) {
        return;
    }
    try {
        if (rdbuf()->is_open() && rdbuf()->close() == nullptr) {
            setstate(std::ios_base::failbit);
        }
    } catch (...) {
        // A stream told to throw on failure still has to lose its temporary file.
    }
    unlink(tempName.c_str());
}

}  // namespace vantor
