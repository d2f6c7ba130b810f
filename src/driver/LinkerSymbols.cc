#include "driver/LinkerSymbols.h"

#include <dlfcn.h>

namespace {

// What the object that owns the table would have found without this program's own function of that
// name; or null. That is the first one in all that is loaded for everybody and, as an object that
// is only now being loaded is not yet part of that, in the object itself and the libraries it
// needs.
template <typename Function>
Function* NextFor(const void* table, const char* name) {
    void* next = dlsym(RTLD_NEXT, name);
    Dl_info owner{};
    if (next == nullptr && dladdr(table, &owner) != 0) {
        if (void* const object = dlopen(owner.dli_fname, RTLD_LAZY | RTLD_NOLOAD)) {
            next = dlsym(object, name);
            dlclose(object);
        }
    }
    return reinterpret_cast<Function*>(next);
}

}  // namespace

extern "C" {

// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
void __gmon_start__() {}

// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
void _ITM_registerTMCloneTable(void* table, std::size_t count) {
    if (auto* const next = NextFor<void(void*, std::size_t)>(table, "_ITM_registerTMCloneTable")) {
        next(table, count);
    }
}

// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
void _ITM_deregisterTMCloneTable(void* table) {
    if (auto* const next = NextFor<void(void*)>(table, "_ITM_deregisterTMCloneTable")) {
        next(table);
    }
}

}  // extern "C"
