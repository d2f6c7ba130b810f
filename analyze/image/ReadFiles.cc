#include "image/ReadFiles.h"

#include <set>
#include <utility>

namespace vantor::analyze {

namespace {

std::set<std::pair<dev_t, ino_t>>& Files() {
    static std::set<std::pair<dev_t, ino_t>> files;
    return files;
}

}  // namespace

void NoteRead(const struct stat& status) { Files().emplace(status.st_dev, status.st_ino); }

bool WasRead(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 && Files().count({status.st_dev, status.st_ino}) != 0;
}

}  // namespace vantor::analyze
