// The least that reading a debug configuration costs: every line cut at its colons, and its second
// and third field at their commas. Usage: bare-lines FILE TIMES EXPECTED-LINES

#include <cstdlib>
#include <fstream>
#include <iostream>
#include <list>
#include <string>
#include <vector>

namespace {

struct Entry {
    std::string name;
    std::vector<std::string> required;
    std::vector<std::string> provided;
    std::string command;
};

std::vector<std::string> Split(const std::string& text, char separator) {
    std::vector<std::string> parts;
    std::size_t start = 0;
    for (std::size_t end = 0; (end = text.find(separator, start)) != std::string::npos;) {
        parts.push_back(text.substr(start, end - start));
        start = end + 1;
    }
    parts.push_back(text.substr(start));
    return parts;
}

std::list<Entry> Read(const char* path) {
    std::list<Entry> entries;
    std::ifstream file(path);
    for (std::string line; std::getline(file, line);) {
        const std::vector<std::string> fields = Split(line, ':');
        if (fields.size() == 4) {
            entries.push_back({fields[0], Split(fields[1], ','), Split(fields[2], ','), fields[3]});
        }
    }
    return entries;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 4) {
        std::cerr << "usage: bare-lines FILE TIMES EXPECTED-LINES" << std::endl;
        return EXIT_FAILURE;
    }
    const std::size_t expected = std::strtoul(argv[3], nullptr, 10);
    for (int i = std::atoi(argv[2]); i > 0; --i) {
        if (Read(argv[1]).size() != expected) {
            return EXIT_FAILURE;
        }
    }
    return EXIT_SUCCESS;
}
