#ifndef VANTOR_ANALYZE_IMAGE_OWNERSHIP_H
#define VANTOR_ANALYZE_IMAGE_OWNERSHIP_H

#include <sys/stat.h>

#include <set>
#include <string>

#include "image/HostImage.h"
#include "model/Finding.h"

namespace vantor::analyze {

// Finds the files and folders of a boot that others than root may change. In an image that an
// ordinary user has laid out the owner of its top folder stands for root.
class Ownership {
public:
    explicit Ownership(const HostImage& hostImage);

    // A file, or a folder whose files a boot uses, with its status.
    void Check(const std::string& path, const struct stat& status, Findings& findings) const;

    // The folders that a path of the host lies in, each once in this object's life. The innermost
    // is judged like a file; above it a folder in which nobody may touch what is another's is good
    // enough.
    void CheckFoldersOf(const std::string& path, Findings& findings);

private:
    const HostImage& image;
    uid_t root = 0;
    std::set<std::string> checked;
};

}  // namespace vantor::analyze

#endif
