/* What each library costs to load and link: opens the named ones in order, with all symbols bound
 * at once, and prints "<nanoseconds> <name>" for each. Name a library after those it needs.
 * Usage: link-cost LIBRARY...
 */
#include <dlfcn.h>
#include <stdio.h>
#include <time.h>

int main(int argc, char** argv) {
    for (int i = 1; i < argc; ++i) {
        struct timespec start;
        struct timespec end;
        clock_gettime(CLOCK_MONOTONIC, &start);
        void* const handle = dlopen(argv[i], RTLD_NOW | RTLD_GLOBAL);
        clock_gettime(CLOCK_MONOTONIC, &end);
        if (handle == NULL) {
            fprintf(stderr, "link-cost: %s\n", dlerror());
            return 1;
        }
        printf("%lld %s\n",
               (long long)(end.tv_sec - start.tv_sec) * 1000000000 + (end.tv_nsec - start.tv_nsec),
               argv[i]);
    }
    return 0;
}
