#ifndef VANTOR_BASEKIT_HOSTSTORAGE_H
#define VANTOR_BASEKIT_HOSTSTORAGE_H

#include <cstddef>
#include <memory>
#include <new>

namespace BaseKit::impl {

// The classes of platform/BaseKit.h reserve plain bytes for what the library keeps in them. This
// library keeps one pointer there, to a `State` that the object owns.
template <typename State>
class HostStorage {
public:
    template <std::size_t Size>
    static void Put(unsigned char (&storage)[Size], std::unique_ptr<State> state) {
        static_assert(sizeof(State*) <= Size && alignof(State*) <= alignof(std::max_align_t));
        new (storage) State*(state.release());
    }

    static State& In(unsigned char* storage) {
        return **std::launder(reinterpret_cast<State**>(storage));
    }

    static const State& In(const unsigned char* storage) {
        return **std::launder(reinterpret_cast<State* const*>(storage));
    }

    static void Release(unsigned char* storage) { delete &In(storage); }
};

}  // namespace BaseKit::impl

#endif
