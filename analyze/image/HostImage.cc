#include "image/HostImage.h"

#include <utility>

namespace vantor::analyze {

HostImage::HostImage(std::string folder) : root(std::move(folder)) {
    while (!root.empty() && root.back() == '/') {
        root.pop_back();
    }
}

std::string HostImage::Open(const std::string& path) const {
    return path.empty() || path.front() != '/' ? path : root + path;
}

}  // namespace vantor::analyze
