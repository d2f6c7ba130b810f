#include "image/ImageFile.h"

#include <dirent.h>
#include <fcntl.h>
#include <limits.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <sstream>
#include <system_error>
#include <utility>

#include "image/ReadFiles.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t largestFile = std::size_t{1} << 30U;  // no plugin comes near it

struct CloseDirectory {
    void operator()(DIR* directory) const { closedir(directory); }
};

int OpenBelow(int root, const std::string& path, int flags) {
    struct open_how how {};
    how.flags = static_cast<std::uint64_t>(static_cast<unsigned>(flags));
    how.resolve = RESOLVE_IN_ROOT;
    return static_cast<int>(syscall(SYS_openat2, root, path.c_str(), &how, sizeof how));
}

// The parts of a path, last first, without those that lead nowhere.
std::vector<std::string> Parts(const std::string& path) {
    std::vector<std::string> parts;
    std::istringstream rest(path);
    for (std::string part; std::getline(rest, part, '/');) {
        if (!part.empty() && part != ".") {
            parts.push_back(part);
        }
    }
    std::reverse(parts.begin(), parts.end());
    return parts;
}

// Empty for what is no link.
std::string LinkTarget(const std::string& path) {
    std::string target(PATH_MAX, '\0');
    const ssize_t length = readlink(path.c_str(), target.data(), target.size());
    target.resize(length < 0 ? 0 : static_cast<std::size_t>(length));
    return target;
}

ImageFile::Kind KindOf(const struct stat& status) {
    if (S_ISDIR(status.st_mode)) {
        return ImageFile::Kind::Folder;
    }
    return S_ISREG(status.st_mode) ? ImageFile::Kind::Regular : ImageFile::Kind::Irregular;
}

// Returns 0 or an errno value.
int ReadContent(int file, std::size_t size, std::string& content) {
    content.resize(size);
    std::size_t held = 0;
    while (held < size) {
        const ssize_t count = read(file, &content[held], size - held);
        if (count < 0 && errno == EINTR) {
            continue;
        }
        if (count < 0) {
            return errno;
        }
        if (count == 0) {
            break;  // it has become shorter meanwhile
        }
        held += static_cast<std::size_t>(count);
    }
    content.resize(held);
    return 0;
}

}  // namespace

std::string ResolveInImage(const HostImage& image, const std::string& path) {
    constexpr int mostLinks = 40;  // as the kernel
    if (path.empty() || path.front() != '/') {
        return path;
    }
    std::vector<std::string> rest = Parts(path);  // last first
    std::string resolved;
    for (int links = 0; !rest.empty();) {
        const std::string part = std::move(rest.back());
        rest.pop_back();
        if (part == "..") {
            resolved.erase(resolved.empty() ? 0 : resolved.rfind('/'));
            continue;
        }
        std::string next = resolved;
        next.append("/").append(part);
        const std::string target = links < mostLinks ? LinkTarget(image.Open(next)) : "";
        if (target.empty()) {
            resolved = std::move(next);
            continue;
        }
        ++links;
        if (target.front() == '/') {
            resolved.clear();
        }
        for (std::string& one : Parts(target)) {
            rest.push_back(std::move(one));
        }
    }
    return resolved.empty() ? "/" : resolved;
}

FileDescriptor OpenInImage(const HostImage& image, const std::string& path, int flags) {
    // Off a 32-bit host's beaten track too: openat2(2) sets no flag of its own, and refuses this
    // one for a file that is only named.
    const int allFlags = flags | O_CLOEXEC | ((flags & O_PATH) != 0 ? 0 : O_LARGEFILE);
    const std::string place = image.Open(path);
    if (place == path) {
        return FileDescriptor(open(place.c_str(), allFlags));
    }
    const FileDescriptor root(open(image.Open("/").c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    const int below = root.IsOpen() ? OpenBelow(root.Get(), path, allFlags) : -1;
    if (below >= 0 || (errno != ENOSYS && errno != EPERM)) {
        return FileDescriptor(below);
    }
    // A kernel that cannot, or a container that may not ask it.
    return FileDescriptor(open(image.Open(ResolveInImage(image, path)).c_str(), allFlags));
}

ImageFile ReadImageFile(const HostImage& image, const std::string& path, std::size_t limit) {
    ImageFile result;
    // O_PATH names the file without opening it: opening a device can already have an effect.
    const FileDescriptor location = OpenInImage(image, path, O_PATH);
    if (!location.IsOpen() || fstat(location.Get(), &result.status) != 0) {
        result.error = errno;
        const bool hidden = errno == EACCES || errno == EPERM;
        result.kind = hidden ? ImageFile::Kind::Unreadable : ImageFile::Kind::Missing;
        return result;
    }
    result.kind = KindOf(result.status);
    if (result.kind != ImageFile::Kind::Regular) {
        return result;
    }
    const FileDescriptor file = OpenInImage(image, path, O_RDONLY | O_NONBLOCK | O_NOCTTY);
    NoteRead(result.status);
    const auto fileSize = static_cast<std::uint64_t>(result.status.st_size);
    const std::uint64_t size = std::min<std::uint64_t>(limit, fileSize);
    if (!file.IsOpen()) {
        result.error = errno;
    } else if (size > largestFile) {
        result.error = EFBIG;
    } else {
        result.error = ReadContent(file.Get(), static_cast<std::size_t>(size), result.content);
    }
    if (result.error != 0) {
        result.kind = ImageFile::Kind::Unreadable;
    }
    return result;
}

std::vector<std::string> ListImageFolder(const HostImage& image, const std::string& path) {
    const FileDescriptor folder = OpenInImage(image, path, O_RDONLY | O_DIRECTORY);
    const int own = folder.IsOpen() ? fcntl(folder.Get(), F_DUPFD_CLOEXEC, 0) : -1;
    DIR* const opened = own < 0 ? nullptr : fdopendir(own);
    if (opened == nullptr) {
        const int error = errno;
        if (own >= 0) {
            close(own);
        }
        throw std::system_error(error, std::generic_category(), image.Open(path));
    }
    const std::unique_ptr<DIR, CloseDirectory> listing(opened);
    std::vector<std::string> names;
    while (true) {
        errno = 0;
        const dirent* const entry = readdir(listing.get());
        if (entry == nullptr) {
            break;
        }
        const std::string name = entry->d_name;
        if (name != "." && name != "..") {
            names.push_back(name);
        }
    }
    if (errno != 0) {
        throw std::system_error(errno, std::generic_category(), path);
    }
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace vantor::analyze
