/* Preloaded into the program: a clock that starts BEGINNING seconds after the epoch and goes on by
 * one second each time it is read, so that every time that the program reports is known.
 *
 * Compiled for 64-bit times, these functions have the names that a program calls which is compiled
 * for them too. One that is not goes on seeing the machine's own clock.
 */
#include <stdatomic.h>
#include <stddef.h>
#include <sys/time.h>
#include <time.h>

_Static_assert(sizeof(time_t) == 8, "the clock must reach beyond 2038");

static atomic_int readings;

static time_t Read(void) { return BEGINNING + atomic_fetch_add(&readings, 1); }

time_t time(time_t* place) {
    const time_t now = Read();
    if (place != NULL) {
        *place = now;
    }
    return now;
}

int gettimeofday(struct timeval* restrict now, void* restrict zone) {
    (void)zone;
    now->tv_sec = Read();
    now->tv_usec = 42;
    return 0;
}
