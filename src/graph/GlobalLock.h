#ifndef VANTOR_GRAPH_GLOBALLOCK_H
#define VANTOR_GRAPH_GLOBALLOCK_H

#include <pthread.h>

#include <atomic>
#include <cstdint>

namespace vantor {

// The one process-wide recursive mutex. It guards
//   - every node's state, height and two adjacency lists, and the barrier registry;
//   - the count of nodes that are under way;
//   - the executor's ready queue, and its flags for stopping and for sleeping workers;
//   - the creation of the run configuration and the host-profile answer.
// It is never held while a plugin's method runs. Condition variables are waited on with it, by a
// thread that holds it once.
class GlobalLock {
public:
    GlobalLock() = delete;

    static void Lock();

    // The calling thread must hold the lock.
    static void Unlock();

    // Releases the lock, waits for `condition` and takes the lock again. The calling thread must
    // hold it exactly once. As with any condition variable it may wake without a broadcast. SIGCHLD
    // is blocked in the thread meanwhile, and afterwards its signal mask is as it was.
    static void Wait(pthread_cond_t& condition);

    static void Broadcast(pthread_cond_t& condition);

    // May be asked by any thread, with or without the lock.
    static bool HeldByCurrentThread();

private:
    static void RecordHolder(std::int32_t count);

    static pthread_mutex_t mutex;
    // Written only with the mutex held and read without it by HeldByCurrentThread(): hence atomic.
    static std::atomic<std::int32_t> holdCount;
    static std::atomic<pthread_t> holder;
};

// Holds GlobalLock from construction to destruction, save between Release() and Retake().
class GlobalLockGuard {
public:
    GlobalLockGuard() { GlobalLock::Lock(); }
    ~GlobalLockGuard() {
        if (held) {
            GlobalLock::Unlock();
        }
    }
    GlobalLockGuard(const GlobalLockGuard&) = delete;
    GlobalLockGuard& operator=(const GlobalLockGuard&) = delete;

    // Must be held by this guard.
    void Release() {
        held = false;
        GlobalLock::Unlock();
    }

    // Must have been released.
    void Retake() {
        GlobalLock::Lock();
        held = true;
    }

private:
    bool held = true;
};

}  // namespace vantor

#endif
