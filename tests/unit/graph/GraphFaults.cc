#include "graph/GraphFaults.h"

#include <cstdlib>

namespace vantor::support {

void GraphFaults::Reset() {
    for (FaultPoint* fault : {&condInit, &threadCreate, &threadJoin, &condWait, &condBroadcast,
                              &yield, &rand, &srand}) {
        fault->Reset();
    }
    draws.clear();
    self = 0;
    created.clear();
    joined.clear();
}

GraphFaults& Faults() {
    // Never destroyed: the wrapped calls are made until the very end.
    static auto* const faults = new GraphFaults;
    return *faults;
}

}  // namespace vantor::support

using vantor::support::Faults;

extern "C" {

int __real_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes);
int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*entry)(void*), void* argument);
int __real_pthread_join(pthread_t thread, void** result);
int __real_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex);
int __real_pthread_cond_broadcast(pthread_cond_t* condition);
pthread_t __real_pthread_self();
int __real_sched_yield();
int __real_rand();
void __real_srand(unsigned seed);

int __wrap_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes) {
    return Faults().condInit.Fails() ? Faults().condInit.Error()
                                     : __real_pthread_cond_init(condition, attributes);
}

int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*entry)(void*), void* argument) {
    if (Faults().threadCreate.Fails()) {
        return Faults().threadCreate.Error();
    }
    const int result = __real_pthread_create(thread, attributes, entry, argument);
    if (result == 0) {
        Faults().created.push_back(*thread);
    }
    return result;
}

int __wrap_pthread_join(pthread_t thread, void** result) {
    if (Faults().threadJoin.Fails()) {
        return Faults().threadJoin.Error();
    }
    Faults().joined.push_back(thread);
    return __real_pthread_join(thread, result);
}

int __wrap_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex) {
    if (!Faults().condWait.Fails()) {
        return __real_pthread_cond_wait(condition, mutex);
    }
    // Others can take the mutex while a thread waits, also where the wait ends at once.
    pthread_mutex_unlock(mutex);
    pthread_mutex_lock(mutex);
    return Faults().condWait.Error();
}

int __wrap_pthread_cond_broadcast(pthread_cond_t* condition) {
    return Faults().condBroadcast.Fails() ? Faults().condBroadcast.Error()
                                          : __real_pthread_cond_broadcast(condition);
}

pthread_t __wrap_pthread_self() {
    const pthread_t pretended = Faults().self;
    return pretended != 0 ? pretended : __real_pthread_self();
}

int __wrap_sched_yield() {
    (void)Faults().yield.Fails();
    return __real_sched_yield();
}

// Called with GlobalLock held, as the executor promises.
int __wrap_rand() {
    (void)Faults().rand.Fails();
    std::deque<int>& draws = Faults().draws;
    if (draws.empty()) {
        return __real_rand();
    }
    const int draw = draws.front();
    draws.pop_front();
    return draw;
}

void __wrap_srand(unsigned seed) {
    (void)Faults().srand.Fails();
    __real_srand(seed);
}

}  // extern "C"
