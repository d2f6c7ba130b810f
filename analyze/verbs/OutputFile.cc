#include "verbs/OutputFile.h"

#include <sys/stat.h>

#include <cerrno>
#include <fstream>
#include <stdexcept>
#include <system_error>

#include "verbs/CommonOptions.h"

namespace vantor::analyze {

namespace {

bool IsSameFile(const std::string& one, const std::string& other) {
    struct stat first {};
    struct stat second {};
    return stat(one.c_str(), &first) == 0 && stat(other.c_str(), &second) == 0 &&
           S_ISREG(first.st_mode) && first.st_dev == second.st_dev && first.st_ino == second.st_ino;
}

}  // namespace

void AddOutputOption(CLI::App& verb, std::string& path) {
    verb.add_option("--output", path, "Write to FILE, not to standard output")
        ->type_name("FILE")
        ->check(HasName());
}

void WriteOutput(const std::string& path, const std::string& result,
                 const std::vector<std::string>& inputs) {
    for (const std::string& input : inputs) {
        if (IsSameFile(path, input)) {
            throw std::runtime_error(path + ": is what the result is made from, not overwritten");
        }
    }
    errno = 0;
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file << result;
    file.close();
    if (!file) {
        throw std::system_error(errno, std::generic_category(), path + ": cannot be written");
    }
}

}  // namespace vantor::analyze
