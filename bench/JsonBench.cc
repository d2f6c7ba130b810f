// What reading JSON files costs: bench-json reader|dom REPEATS FILE...
//
// "reader" is vantor's own reader, "dom" is nlohmann-json's, each on a std::ifstream of its own for
// every file. Prints the bytes and nanoseconds of all repeats together; then, so that both can be
// seen to have read the same, how many values the files hold, the bytes of their texts and the sum
// of their numbers.

#include <valgrind/callgrind.h>

#include <chrono>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <iomanip>
#include <iostream>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>
#include <vector>

#include "json/JsonReader.h"

namespace vantor::bench {

namespace {

struct Content {
    std::size_t values = 0;
    std::size_t textBytes = 0;
    double sum = 0;
};

void Count(const JsonValue& value, Content& content) {
    ++content.values;
    if (value.kind == JsonKind::String) {
        content.textBytes += value.text.size();
    } else if (value.kind == JsonKind::Number) {
        content.sum += value.number;
    } else if (value.kind == JsonKind::Object) {
        for (const auto& [key, member] : value.members) {
            content.textBytes += key.size();
            Count(member, content);
        }
    } else if (value.kind == JsonKind::Array) {
        for (const JsonValue& element : value.elements) {
            Count(element, content);
        }
    }
}

void Count(const nlohmann::json& value, Content& content) {
    ++content.values;
    if (value.is_string()) {
        content.textBytes += value.get_ref<const std::string&>().size();
    } else if (value.is_number()) {
        content.sum += value.get<double>();
    } else if (value.is_object()) {
        for (const auto& item : value.items()) {
            content.textBytes += item.key().size();
            Count(item.value(), content);
        }
    } else if (value.is_array()) {
        for (const nlohmann::json& element : value) {
            Count(element, content);
        }
    }
}

std::ifstream Open(const std::string& path) {
    std::ifstream file(path);
    if (!file) {
        throw std::runtime_error("cannot open " + path);
    }
    return file;
}

JsonValue ReadOwn(const std::string& path) {
    std::ifstream file = Open(path);
    JsonValue value;
    ReadValue(file, value);
    if (value.kind == JsonKind::None) {
        throw std::runtime_error("cannot read " + path);
    }
    return value;
}

nlohmann::json ReadDom(const std::string& path) {
    std::ifstream file = Open(path);
    return nlohmann::json::parse(file);
}

template <typename Read>
void Measure(const Read& read, int repeats, const std::vector<std::string>& paths) {
    std::size_t bytes = 0;
    Content content;
    for (const std::string& path : paths) {  // the caches are warm after this
        bytes += static_cast<std::size_t>(Open(path).seekg(0, std::ios::end).tellg());
        Count(read(path), content);
    }
    CALLGRIND_START_INSTRUMENTATION;
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < repeats; ++i) {
        for (const std::string& path : paths) {
            read(path);
        }
    }
    const std::chrono::duration<double, std::nano> taken = std::chrono::steady_clock::now() - start;
    CALLGRIND_STOP_INSTRUMENTATION;
    std::cout << std::fixed << "bytes " << bytes * static_cast<std::size_t>(repeats)
              << "\nnanoseconds " << taken.count() << "\nvalues " << content.values << "\ntext "
              << content.textBytes << "\nsum " << content.sum << std::endl;
}

}  // namespace

}  // namespace vantor::bench

int main(int argc, char** argv) {
    using namespace vantor::bench;
    try {
        const std::vector<std::string> words(argv + 1, argv + argc);
        const int repeats = std::stoi(words.at(1));
        const std::vector<std::string> paths(words.begin() + 2, words.end());
        if (words[0] == "reader") {
            Measure(ReadOwn, repeats, paths);
        } else {
            Measure(ReadDom, repeats, paths);
        }
    } catch (const std::exception& error) {
        std::cerr << "bench-json: " << error.what() << std::endl;
        return EXIT_FAILURE;
    }
    return EXIT_SUCCESS;
}
