// Runs the random graph of a seed in randomised serial order, in a process that nothing else has
// drawn random numbers in, and prints the order: RandomisedOrder SEED LARGEST
#include <cstdlib>
#include <iostream>

#include "graph/StressRun.h"

int main(int argc, char** argv) {
    if (argc != 3) {
        return 2;
    }
    const auto seed = static_cast<std::uint32_t>(std::strtoul(argv[1], nullptr, 10));
    const auto largest = static_cast<std::size_t>(std::strtoul(argv[2], nullptr, 10));
    const vantor::support::RandomGraph graph = vantor::support::MakeRandomGraph(seed, largest);
    vantor::support::StressRun run(graph);
    run.Run(1, true, vantor::support::Requests::BeforeTheWorkersBegin);
    for (const std::size_t node : run.Order()) {
        std::cout << node << '\n';
    }
    return std::cout.flush().good() ? 0 : 1;
}
