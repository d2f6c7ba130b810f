#ifndef VANTOR_GRAPH_SPINPAUSE_H
#define VANTOR_GRAPH_SPINPAUSE_H

namespace vantor {

// Keeps the processor for a moment, telling it that another one is waited for: `length` times what
// its pause instruction takes, which is some 10 to 140 cycles; no time at all where it has none.
// For whoever looks again and again at what another thread changes, so as to disturb it little.
inline void SpinPause(int length) {
    for (int i = 0; i < length; ++i) {
#if defined(__i386__) || defined(__x86_64__)
        __builtin_ia32_pause();
#endif
    }
}

}  // namespace vantor

#endif
