#ifndef VANTOR_ANALYZE_IMAGE_IMAGEFILE_H
#define VANTOR_ANALYZE_IMAGE_IMAGEFILE_H

#include <sys/stat.h>

#include <string>
#include <vector>

#include "image/HostImage.h"
#include "io/FileDescriptor.h"

namespace vantor::analyze {

// The path on the host that a path leads to: all links followed as on the host, what does not exist
// taken as it stands. A relative path is left as it is.
std::string ResolveInImage(const HostImage& image, const std::string& path);

// Opens a path of the host for reading, or with `flags` of open(2). Symbolic links lead where they
// lead on the host, also absolute ones of a host that lies in a folder. No terminal becomes the
// controlling one. A closed descriptor, with errno, where it cannot be opened.
FileDescriptor OpenInImage(const HostImage& image, const std::string& path, int flags);

// What lies at a path of the host.
struct ImageFile {
    enum class Kind {
        Missing,     // `error` says why it cannot be reached: a dangling link, say
        Unreadable,  // `error` says why, but the boot, which is root's, could
        Folder,
        Irregular,  // a FIFO, a socket, a device: never opened
        Regular,
    };

    Kind kind = Kind::Missing;
    int error = 0;          // an errno value
    struct stat status {};  // unless missing
    std::string content;    // of a regular file, at most as much as was asked for
};

// Never blocks. Reads at most `limit` bytes of a regular file, which counts as read then
// (image/ReadFiles.h). Throws std::bad_alloc.
ImageFile ReadImageFile(const HostImage& image, const std::string& path,
                        std::size_t limit = static_cast<std::size_t>(-1));

// The names in a folder of the host but "." and "..", by their bytes. Throws std::system_error,
// naming `path`, when it cannot be read.
std::vector<std::string> ListImageFolder(const HostImage& image, const std::string& path);

}  // namespace vantor::analyze

#endif
