#include "graph/GlobalLock.h"

#include <signal.h>

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

// Keeps the end of a child process from waking this thread, which would be for nothing: the kernel
// gives SIGCHLD to any thread that does not block it (signal(7)), and system() blocks it in the one
// that waits for the command. A signal that has no other thread to go to is delivered afterwards.
class SigchldBlock {
public:
    SigchldBlock() {
        sigset_t set;
        sigemptyset(&set);
        sigaddset(&set, SIGCHLD);
        pthread_sigmask(SIG_BLOCK, &set, &before);
    }
    ~SigchldBlock() { pthread_sigmask(SIG_SETMASK, &before, nullptr); }
    SigchldBlock(const SigchldBlock&) = delete;
    SigchldBlock& operator=(const SigchldBlock&) = delete;

private:
    sigset_t before{};
};

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
    const SigchldBlock block;
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
