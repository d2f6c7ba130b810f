#ifndef VANTOR_PLUGINS_TESTS_TESTOBJECTS_H
#define VANTOR_PLUGINS_TESTS_TESTOBJECTS_H

#include <cstdint>
#include <string>
#include <vector>

#include "graph/Node.h"

namespace vantor::support {

// The shared object of that name, built from the sources in objects/.
std::string ObjectPath(const std::string& name);

// Whether this process has the file loaded.
bool IsLoaded(const std::string& path);

// The result of a function that a loaded object exports for tests, "CallsOfStart" say.
std::uint32_t Ask(const std::string& path, const char* function);

// The names of the nodes, in order.
std::vector<std::string> NamesOf(const Node::Edges& nodes);

// Answers of dlsym(3) in place of the real ones while this object lives; one at a time.
class SymbolSubstitutes {
public:
    SymbolSubstitutes() = default;
    ~SymbolSubstitutes();
    SymbolSubstitutes(const SymbolSubstitutes&) = delete;
    SymbolSubstitutes& operator=(const SymbolSubstitutes&) = delete;

    // The look-up of `symbol` finds `address`, which may be null, and no error.
    static void Set(const std::string& symbol, const void* address);
};

}  // namespace vantor::support

#endif
