#include "plugins/TestObjects.h"

#include <dlfcn.h>

#include <map>
#include <stdexcept>

#include "graph/GlobalLock.h"

namespace vantor::support {

namespace {

std::map<std::string, const void*>& Substitutes() {
    static std::map<std::string, const void*> substitutes;
    return substitutes;
}

}  // namespace

std::string ObjectPath(const std::string& name) {
    return std::string(TEST_OBJECTS_FOLDER) + "/lib" + name + ".so";
}

bool IsLoaded(const std::string& path) {
    void* const handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_NOLOAD);
    if (handle != nullptr) {
        dlclose(handle);
    }
    return handle != nullptr;
}

std::uint32_t Ask(const std::string& path, const char* function) {
    void* const handle = dlopen(path.c_str(), RTLD_LAZY | RTLD_NOLOAD);
    if (handle == nullptr) {
        throw std::runtime_error(path + " is not loaded");
    }
    using Function = std::uint32_t (*)();
    const auto address = reinterpret_cast<Function>(dlsym(handle, function));
    dlclose(handle);
    if (address == nullptr) {
        throw std::runtime_error(path + " does not export " + function);
    }
    return address();
}

std::vector<std::string> NamesOf(const Node::Edges& nodes) {
    const GlobalLockGuard guard;
    std::vector<std::string> names;
    for (const Node* node : nodes) {
        names.push_back(node->Name());
    }
    return names;
}

SymbolSubstitutes::~SymbolSubstitutes() { Substitutes().clear(); }

void SymbolSubstitutes::Set(const std::string& symbol, const void* address) {
    Substitutes()[symbol] = address;
}

}  // namespace vantor::support

extern "C" {

void* __real_dlsym(void* handle, const char* symbol);

void* __wrap_dlsym(void* handle, const char* symbol) {
    const auto& substitutes = vantor::support::Substitutes();
    const auto substitute = substitutes.find(symbol);
    if (substitute == substitutes.end()) {
        return __real_dlsym(handle, symbol);
    }
    dlerror();  // a look-up that succeeds clears the linker's error
    return const_cast<void*>(substitute->second);
}

}  // extern "C"
