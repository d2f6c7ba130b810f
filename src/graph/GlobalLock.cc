#include "graph/GlobalLock.h"

#include <algorithm>

#include "graph/SpinPause.h"

namespace vantor {

namespace {

// What is done under the lock mostly takes far less than a microsecond. Who has found it taken
// therefore tries again for about as long as going to sleep and being woken may take, and so spares
// itself that, and the holder the system call that wakes. The pauses double: the trying is to
// disturb the holder little.
void AcquireTaken(pthread_mutex_t& mutex) {
    constexpr int tries = 10;
    constexpr int longestPause = 128;
    for (int i = 1, pause = 1; i < tries; ++i) {
        SpinPause(pause);
        pause = std::min(2 * pause, longestPause);
        if (pthread_mutex_trylock(&mutex) == 0) {
            return;
        }
    }
    pthread_mutex_lock(&mutex);
}

}  // namespace

pthread_mutex_t GlobalLock::mutex = PTHREAD_RECURSIVE_MUTEX_INITIALIZER_NP;
std::atomic<std::int32_t> GlobalLock::holdCount{0};
std::atomic<pthread_t> GlobalLock::holder{};

void GlobalLock::Lock() {
    if (pthread_mutex_trylock(&mutex) != 0) {
        AcquireTaken(mutex);
    }
    RecordHolder(holdCount.load(std::memory_order_relaxed) + 1);
}

void GlobalLock::Unlock() {
    holdCount.store(holdCount.load(std::memory_order_relaxed) - 1, std::memory_order_release);
    pthread_mutex_unlock(&mutex);
}

void GlobalLock::Wait(pthread_cond_t& condition) {
    holdCount.store(0, std::memory_order_release);
    pthread_cond_wait(&condition, &mutex);
    RecordHolder(1);
}

void GlobalLock::Broadcast(pthread_cond_t& condition) { pthread_cond_broadcast(&condition); }

// The counter says that some thread holds the lock before the holder says which only if the holder
// was stored first: the other way round, a former holder could read the new count beside its own
// old name and believe that the lock is its own.
void GlobalLock::RecordHolder(std::int32_t count) {
    holder.store(pthread_self(), std::memory_order_relaxed);
    holdCount.store(count, std::memory_order_release);
}

bool GlobalLock::HeldByCurrentThread() {
    return holdCount.load(std::memory_order_acquire) >= 1 &&
           pthread_equal(holder.load(std::memory_order_relaxed), pthread_self()) != 0;
}

}  // namespace vantor
