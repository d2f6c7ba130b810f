/* A native plugin that does nothing but take its time. Its description is written over `stamp` in
 * the finished object: microseconds, names that it requires, "|", names that it provides.
 */
#include <stddef.h>
#include <stdlib.h>
#include <string.h>
#include <time.h>
#include <vantor/plugin.h>

enum { Most = 64 };

/* Not static: what others could write, the compiler must not take for a constant. */
__attribute__((visibility("hidden"))) char stamp[1024] = "VANTOR BENCH SLEEPING PLUGIN";

static const char* needs[Most];
static const char* gives[Most];
static long microseconds;

VANTOR_METHOD(start) {
    const struct timespec pause = {microseconds / 1000000, microseconds % 1000000 * 1000};
    return nanosleep(&pause, NULL) == 0 ? 0 : 1;
}

VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(needs, gives);

__attribute__((constructor)) static void Describe(void) {
    char* rest = stamp;
    microseconds = strtol(strsep(&rest, " "), NULL, 10);
    const char** list = needs;
    for (char* word = NULL; (word = strsep(&rest, " ")) != NULL;) {
        if (strcmp(word, "|") == 0) {
            list = gives;
        } else if (*word != '\0') {
            *list++ = word;
        }
    }
}
