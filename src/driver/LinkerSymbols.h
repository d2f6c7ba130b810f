#ifndef VANTOR_DRIVER_LINKERSYMBOLS_H
#define VANTOR_DRIVER_LINKERSYMBOLS_H

#include <cstddef>

// Three functions that the compiler's start-up code (crti.o and crtbeginS.o) in every shared object
// asks for, weakly, and that hardly any process has: one that begins the profiling of a program,
// and two of the library for transactional memory. Where they are missing, the dynamic linker looks
// for them in vain in everything that is loaded, for each plugin in all plugins before it: of
// thousands of plugins that is more than half of the loading. The program exports them, so that
// they are found in the first place that is looked at. Nothing of ours calls them.
extern "C" {

// Does nothing: only a program that was built for gprof(1) has anything to begin.
// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
__attribute__((visibility("default"))) void __gmon_start__();

// Called for an object with transactions in it, while it is loaded and unloaded; it brings the
// library for them (GCC's libitm). Passed on to the function that the object would have found
// without this one; does nothing where there is none. `table` holds `count` pairs of addresses and
// stays the object's own.
// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
__attribute__((visibility("default"))) void _ITM_registerTMCloneTable(void* table,
                                                                      std::size_t count);
// NOLINTNEXTLINE(bugprone-reserved-identifier,readability-identifier-naming): the linker's name
__attribute__((visibility("default"))) void _ITM_deregisterTMCloneTable(void* table);

}  // extern "C"

#endif
