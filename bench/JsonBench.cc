// What reading JSON files costs, as one benchmark of Google Benchmark's:
//
//     bench-json reader|dom ITERATIONS FILE...
//
// "reader" is vantor's own reader, "dom" is nlohmann-json's, each on a std::ifstream of its own for
// every file. An iteration reads all files. Counters tell their bytes and, so that both can be seen
// to have read the same, how many values they hold, the bytes of their texts and the sum of their
// numbers.

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>
#include <vector>

#include "GuardedBenchmarks.h"
#include "MeasuredPart.h"
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
void Measure(benchmark::State& state, const Read& read, const std::vector<std::string>& paths) {
    std::size_t bytes = 0;
    Content content;
    for (const std::string& path : paths) {  // the caches are warm after this
        bytes += static_cast<std::size_t>(Open(path).seekg(0, std::ios::end).tellg());
        Count(read(path), content);
    }
    while (state.KeepRunning()) {
        state.SetIterationTime(MeasuredSeconds([&] {
            for (const std::string& path : paths) {
                benchmark::DoNotOptimize(read(path));
            }
        }));
    }
    state.counters["bytes"] = static_cast<double>(bytes);
    state.counters["values"] = static_cast<double>(content.values);
    state.counters["text"] = static_cast<double>(content.textBytes);
    state.counters["sum"] = content.sum;
}

void MeasureReader(benchmark::State& state, const std::string& name,
                   const std::vector<std::string>& paths) {
    Guarded(state, [&] {
        if (name == "reader") {
            Measure(state, ReadOwn, paths);
        } else if (name == "dom") {
            Measure(state, ReadDom, paths);
        } else {
            throw std::invalid_argument("no such reader: " + name);
        }
    });
}

}  // namespace

}  // namespace vantor::bench

int main(int argc, char** argv) {
    using namespace vantor::bench;
    benchmark::Initialize(&argc, argv);
    try {
        const std::vector<std::string> words(argv + 1, argv + argc);
        const int iterations = std::stoi(words.at(1));
        const std::vector<std::string> paths(words.begin() + 2, words.end());
        benchmark::RegisterBenchmark(words[0].c_str(), MeasureReader, words[0], paths)
            ->Iterations(iterations)
            ->UseManualTime();
        return RunBenchmarks();
    } catch (const std::exception& error) {
        std::cerr << "bench-json: " << error.what() << std::endl;
        return EXIT_FAILURE;
    }
}
