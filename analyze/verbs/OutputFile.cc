#include "verbs/OutputFile.h"

#include <sys/stat.h>

#include <cerrno>
#include <fstream>
#include <stdexcept>
#include <system_error>

#include "image/ReadFiles.h"
#include "io/afstream.h"
#include "verbs/CommonOptions.h"

namespace vantor::analyze {

namespace {

[[noreturn]] void Fail(const std::string& path, int error) {
    throw std::runtime_error(path +
                             ": cannot be written: " + std::generic_category().message(error));
}

bool IsRegular(const std::string& path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

void Replace(const std::string& path, const std::string& result) {
    afstream file;
    errno = 0;
    try {
        file.open(path.c_str(), std::ios::binary | std::ios::out);
        file << result;
        file.commit();
    } catch (const std::runtime_error&) {
        Fail(path, errno);
    }
}

// Something new, a device, a pipe, or what a link leads to.
void WriteInto(const std::string& path, const std::string& result) {
    errno = 0;
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file << result;
    file.close();
    if (!file) {
        Fail(path, errno);
    }
}

}  // namespace

void AddOutputOption(CLI::App& verb, std::string& path) {
    verb.add_option("--output", path, "Write to FILE, not to standard output")
        ->type_name("FILE")
        ->check(HasName());
}

void WriteOutput(const std::string& path, const std::string& result) {
    if (WasRead(path)) {
        throw std::runtime_error(path + ": is what the result is made from, not overwritten");
    }
    if (IsRegular(path)) {
        Replace(path, result);
    } else {
        WriteInto(path, result);
    }
}

}  // namespace vantor::analyze
