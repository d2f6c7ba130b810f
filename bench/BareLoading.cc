// The least that loading native plugins costs: dlopen() with the flags of the program, two symbols,
// one call, in directory order. Usage: bare-loading DIRECTORY EXPECTED

#include <dirent.h>
#include <dlfcn.h>
#include <vantor/plugin.h>

#include <cstdlib>
#include <cstring>
#include <iostream>
#include <string>

namespace {

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
    DIR* const folder = argc == 3 ? opendir(argv[1]) : nullptr;
    if (folder == nullptr) {
        std::cerr << "usage: bare-loading DIRECTORY EXPECTED" << std::endl;
        return EXIT_FAILURE;
    }
    int loaded = 0;
    const std::string prefix = std::string(argv[1]) + '/';
    while (const dirent* const entry = readdir(folder)) {
        if (entry->d_name[0] != '.' && LoadAndStart(prefix + entry->d_name)) {
            ++loaded;
        }
    }
    closedir(folder);
    return loaded == std::atoi(argv[2]) ? EXIT_SUCCESS : EXIT_FAILURE;
}
