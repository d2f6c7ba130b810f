// The least that loading native plugins costs: dlopen() with the flags of the program, two symbols,
// one call, in directory order. With "duties" it also does for each what a boot owes to the host
// beside loading: sees whether the file is there and whole, looks for the debug configuration and
// tells the system log what is executed. Usage: bare-loading DIRECTORY EXPECTED [duties]

#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>
#include <vantor/plugin.h>

#include <cstdlib>
#include <cstring>
#include <iostream>
#include <string>

namespace {

// Nothing is opened before it is known to be a file: opening a device can have an effect.
bool IsWhole(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return false;
    }
    char headers[1024];
    const int file = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    const bool isRead = pread(file, headers, sizeof headers, 0) > 0;
    close(file);
    return isRead;
}

void LookForDebugConfiguration() {
    const int file = open("/etc/nuvex/vantor/debug.conf", O_RDONLY);
    if (file >= 0) {
        close(file);
    }
}

bool LoadAndStart(const std::string& path) {
    void* const handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_GLOBAL);
    if (handle == nullptr) {
        return false;
    }
    const auto* const operations =
        static_cast<const vantor_operations*>(dlsym(handle, "operations"));
    const void* const metadata = dlsym(handle, "metadata");
    return operations != nullptr && metadata != nullptr && operations->start() == 0;
}

}  // namespace

int main(int argc, char** argv) {
    const bool duties = argc == 4 && std::strcmp(argv[3], "duties") == 0;
    DIR* const folder = argc == 3 || duties ? opendir(argv[1]) : nullptr;
    if (folder == nullptr) {
        std::cerr << "usage: bare-loading DIRECTORY EXPECTED [duties]" << std::endl;
        return EXIT_FAILURE;
    }
    int loaded = 0;
    const std::string prefix = std::string(argv[1]) + '/';
    while (const dirent* const entry = readdir(folder)) {
        if (entry->d_name[0] == '.') {
            continue;
        }
        const std::string path = prefix + entry->d_name;
        if (duties) {
            LookForDebugConfiguration();
            if (!IsWhole(path)) {
                continue;
            }
            syslog(LOG_INFO, "executing start plugin: %s", entry->d_name);
        }
        loaded += LoadAndStart(path) ? 1 : 0;
    }
    closedir(folder);
    return loaded == std::atoi(argv[2]) ? EXIT_SUCCESS : EXIT_FAILURE;
}
