// The least that running shell commands costs: threads that take numbers from one counter and call
// system() for each. Usage: bare-commands THREADS COMMANDS

#include <atomic>
#include <cstdlib>
#include <iostream>
#include <thread>
#include <vector>

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "usage: bare-commands THREADS COMMANDS" << std::endl;
        return EXIT_FAILURE;
    }
    const int count = std::atoi(argv[2]);
    std::atomic<int> next{0};
    std::atomic<int> succeeded{0};
    std::vector<std::thread> threads;
    for (int i = std::atoi(argv[1]); i > 0; --i) {
        threads.emplace_back([&] {
            while (next++ < count) {
                if (std::system("true") == 0) {
                    ++succeeded;
                }
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    return succeeded == count ? EXIT_SUCCESS : EXIT_FAILURE;
}
