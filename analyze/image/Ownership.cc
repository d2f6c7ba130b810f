#include "image/Ownership.h"

#include <fcntl.h>
#include <fmt/format.h>

#include "image/ImageFile.h"

namespace vantor::analyze {

namespace {

bool StatusOf(const HostImage& image, const std::string& path, struct stat& status) {
    const FileDescriptor location = OpenInImage(image, path, O_PATH);
    return location.IsOpen() && fstat(location.Get(), &status) == 0;
}

// The folder that a path lies in; empty for the root and for the working folder's own.
std::string FolderOf(const std::string& path) {
    const std::size_t end = path.find_last_not_of('/');
    const std::size_t slash = end == std::string::npos ? end : path.find_last_of('/', end);
    if (slash == std::string::npos) {
        return {};
    }
    const std::size_t last = path.find_last_not_of('/', slash);
    return last == std::string::npos ? "/" : path.substr(0, last + 1);
}

}  // namespace

Ownership::Ownership(const HostImage& hostImage) : image(hostImage) {
    struct stat status {};
    if (StatusOf(image, "/", status)) {
        root = status.st_uid;
    }
}

void Ownership::Check(const std::string& path, const struct stat& status,
                      Findings& findings) const {
    std::string who;
    const auto add = [&who](const std::string& one) { who += (who.empty() ? "" : ", ") + one; };
    if (status.st_uid != root && status.st_uid != 0) {
        add(fmt::format("its owner, user {}", status.st_uid));
    }
    if ((status.st_mode & S_IWGRP) != 0) {
        add(fmt::format("its group, {}", status.st_gid));
    }
    if ((status.st_mode & S_IWOTH) != 0) {
        add("everybody");
    }
    if (!who.empty()) {
        findings.push_back({Severity::Warning,
                            "writable",
                            {path, 0, 0},
                            fmt::format("can be written by others than root: {} (mode {:04o})", who,
                                        status.st_mode & 07777U)});
    }
}

void Ownership::CheckFoldersOf(const std::string& path, Findings& findings) {
    bool innermost = true;
    // Above one that has been checked all have been.
    for (std::string folder = FolderOf(path); !folder.empty() && checked.insert(folder).second;
         folder = FolderOf(folder)) {
        struct stat status {};
        if (StatusOf(image, folder, status)) {
            if (!innermost && (status.st_mode & S_ISVTX) != 0) {
                status.st_mode &= ~static_cast<mode_t>(S_IWGRP | S_IWOTH);
            }
            Check(folder, status, findings);
        }
        innermost = false;
    }
}

}  // namespace vantor::analyze
