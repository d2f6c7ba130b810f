/*
 * What the example plugins share: the sample host's state is a folder, and a file in it says that
 * something is there. A plugin that finds missing what it waited for fails, so a boot in the wrong
 * order does not go unnoticed.
 */
#ifndef SAMPLE_HOST_H
#define SAMPLE_HOST_H

#include <stdint.h>
#include <stdio.h>
#include <time.h>
#include <unistd.h>

#define SAMPLE_HOST_STATE "/var/run/sample-host/"

/* Whether an earlier plugin left `name`. */
static inline int host_has(const char* name) {
    char path[256];
    snprintf(path, sizeof path, SAMPLE_HOST_STATE "%s", name);
    return access(path, F_OK) == 0;
}

/* Leaves `name` for later plugins, with a line of text. Returns 0, or 1 when it cannot. */
static inline uint32_t host_leave(const char* name, const char* text) {
    char path[256];
    snprintf(path, sizeof path, SAMPLE_HOST_STATE "%s", name);
    FILE* file = fopen(path, "w");
    if (file == NULL) {
        return 1;
    }
    const int written = fprintf(file, "%s\n", text) > 0;
    return fclose(file) == 0 && written ? 0 : 1;
}

/* Hardware takes its time; so does the sample's. */
static inline void host_busy(long milliseconds) {
    const struct timespec time = {milliseconds / 1000, milliseconds % 1000 * 1000000};
    nanosleep(&time, NULL);
}

#endif
