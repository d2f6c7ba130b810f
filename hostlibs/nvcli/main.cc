#include <cstdio>
#include <exception>
#include <iostream>

#include "nvcli/Nvcli.h"

int main(int argc, char** argv) {
    try {
        return nvcli::RunNvcli({argv + (argc > 0 ? 1 : 0), argv + argc}, std::cout, std::cerr);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "nvcli: %s\n", error.what());
        return nvcli::Failure;
    }
}
