#include "support/TempFolder.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace vantor::support {

namespace {

[[noreturn]] void Throw(const std::string& what, const std::string& path) {
    throw std::runtime_error("cannot " + what + " " + path + ": " + std::strerror(errno));
}

}  // namespace

TempFolder::TempFolder() {
    const char* const base = std::getenv("TMPDIR");
    path = std::string(base != nullptr && *base != '\0' ? base : "/tmp") + "/vantor-test-XXXXXX";
    if (mkdtemp(path.data()) == nullptr) {
        Throw("create", path);
    }
}

TempFolder::~TempFolder() {
    boost::system::error_code ignored;
    boost::filesystem::remove_all(path, ignored);
}

std::vector<std::string> TempFolder::Entries() const {
    std::vector<std::string> names;
    for (const auto& entry : boost::filesystem::directory_iterator(path)) {
        names.push_back(entry.path().filename().string());
    }
    std::sort(names.begin(), names.end());
    return names;
}

std::string ReadFile(const std::string& path) {
    std::ifstream stream(path, std::ios_base::binary);
    if (!stream.is_open()) {
        Throw("open", path);
    }
    std::ostringstream content;
    if (stream.peek() != std::ifstream::traits_type::eof()) {
        content << stream.rdbuf();
    }
    return content.str();
}

void WriteFile(const std::string& path, const std::string& content, mode_t mode) {
    std::ofstream stream(path, std::ios_base::binary | std::ios_base::trunc);
    stream << content << std::flush;
    if (!stream.good() || chmod(path.c_str(), mode) != 0) {
        Throw("write", path);
    }
}

mode_t ModeOf(const std::string& path) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) {
        Throw("look at", path);
    }
    return status.st_mode & 07777U;
}

}  // namespace vantor::support
