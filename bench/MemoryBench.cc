// What nodes cost in memory: bench-memory KIND NODES
//
//     plugin    debug plugins that stand alone
//     barrier   barriers that nobody provides or requires
//     graph     half plugins, half barriers: each plugin provides one barrier and requires another
//
// Prints "resident", the bytes by which the process grew, and "own", the sum of the objects'
// sizes and their names' bytes.

#include <unistd.h>

#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <list>
#include <stdexcept>
#include <string>
#include <vector>

#include "graph/InitBarrier.h"
#include "graph/KeepUntilExit.h"
#include "plugins/DebugPlugin.h"

namespace vantor::bench {

namespace {

// statm(5): the second number is the resident pages.
std::size_t ResidentBytes() {
    std::ifstream file("/proc/self/statm");
    std::size_t total = 0;
    std::size_t resident = 0;
    if (!(file >> total >> resident)) {
        throw std::runtime_error("cannot read /proc/self/statm");
    }
    return resident * static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
}

// As long as the names of real plugins and barriers are.
std::string Name(const char* kind, std::size_t number) {
    const std::string digits = std::to_string(number);
    return std::string("storage-") + kind + "-" + std::string(7 - digits.size(), '0') + digits;
}

// Both make a node that lives until the process ends, as in a boot, and return its own bytes.
std::size_t MakePlugin(std::size_t number, const std::list<std::string>& required,
                       const std::list<std::string>& provided) {
    const auto* const plugin = new DebugPlugin(Name("plugin", number), required, provided, "true");
    KeepUntilExit(*plugin);
    return sizeof(DebugPlugin) + plugin->Name().size() + 1;
}

std::size_t MakeBarrier(std::size_t number) {
    return sizeof(InitBarrier) + InitBarrier::Get(Name("barrier", number))->Name().size() + 1;
}

std::size_t MakeNodes(const std::string& kind, std::size_t count) {
    std::size_t own = 0;
    if (kind == "plugin") {
        for (std::size_t i = 0; i < count; ++i) {
            own += MakePlugin(i, {}, {});
        }
    } else if (kind == "barrier") {
        for (std::size_t i = 0; i < count; ++i) {
            own += MakeBarrier(i);
        }
    } else if (kind == "graph") {
        for (std::size_t i = 0; i < count / 2; ++i) {
            own += MakeBarrier(i);
            own += MakePlugin(i, {Name("barrier", i / 2)}, {Name("barrier", i)});
        }
    } else {
        throw std::invalid_argument("no such kind of node: " + kind);
    }
    return own;
}

void PrintMemory(const std::string& kind, std::size_t count) {
    const std::size_t before = ResidentBytes();
    const std::size_t own = MakeNodes(kind, count);
    std::cout << "resident " << ResidentBytes() - before << "\nown " << own << std::endl;
}

}  // namespace

}  // namespace vantor::bench

int main(int argc, char** argv) {
    try {
        const std::vector<std::string> words(argv + 1, argv + argc);
        vantor::bench::PrintMemory(words.at(0), std::stoul(words.at(1)));
    } catch (const std::exception& error) {
        std::cerr << "bench-memory: " << error.what() << std::endl;
        return EXIT_FAILURE;
    }
    return EXIT_SUCCESS;
}
