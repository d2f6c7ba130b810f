/* A native plugin whose description is stamped into the finished object, so that a test makes
 * hundreds of them without a compiler. When it is loaded it reads the lines of `description`
 * ("<key> <value>") and fills the two exported objects from them. They are laid out here by hand:
 * the interface is checked against its definition and not against the header of the day.
 */
#define _GNU_SOURCE

#include <dirent.h>
#include <fcntl.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <time.h>
#include <unistd.h>

enum { most = 300 };

struct Operations {
    uint32_t (*start)(void);
    uint32_t (*applyHostProfile)(void);
};

struct Metadata {
    int32_t version;
    const char** requires;
    const char** provides;
    const char* pluginVersion;
    uint8_t runOnce;
    const char** requiredFlags;
    const char** disablingFlags;
};

/* Not static: what others could write, the compiler must not take for a constant. */
__attribute__((visibility("hidden"))) char description[16384] = "VANTOR TEST PLUGIN DESCRIPTION";

static const char *requires[most], *provides[most], *requiredFlags[most], *disablingFlags[most];
static const char *name, *creates, *opensToRead, *opensToWrite, *meetsAt;
static uint32_t startReturns, applyReturns;
static long meets;

/* Linked with -Bsymbolic: other plugins export the same two names. */
struct Operations operations;
struct Metadata metadata = {1, requires, provides, NULL, 0, requiredFlags, disablingFlags};

/* One line in one write, so that concurrent plugins do not mix theirs: what, who, when. */
static void Note(const char* what) {
    struct timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    char line[512];
    const int length = snprintf(line, sizeof line, "%s %s %lld.%09ld\n", what, name,
                                (long long)now.tv_sec, now.tv_nsec);
    const int fd = open("/tmp/ran", O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    if (fd >= 0) {
        if (write(fd, line, (size_t)length) != length) {
            abort();
        }
        close(fd);
    }
}

static void Open(const char* path, int flags) {
    const int fd = open(path, flags | O_CLOEXEC, 0644);
    if (fd < 0) {
        abort();
    }
    close(fd);
}

static long EntriesOf(const char* folder) {
    long count = -2; /* "." and ".." */
    DIR* stream = opendir(folder);
    if (stream == NULL) {
        abort();
    }
    while (readdir(stream) != NULL) {
        ++count;
    }
    closedir(stream);
    return count;
}

/* Returns once as many plugins as the description says are here at one time. */
static void Meet(void) {
    char path[512];
    snprintf(path, sizeof path, "%s/%s", meetsAt, name);
    Open(path, O_WRONLY | O_CREAT);
    while (EntriesOf(meetsAt) < meets) {
        const struct timespec pause = {0, 1000000};
        nanosleep(&pause, NULL);
    }
}

static uint32_t Work(const char* what, uint32_t result) {
    Note(what);
    if (creates != NULL) {
        Open(creates, O_WRONLY | O_CREAT);
    }
    if (opensToRead != NULL) {
        Open(opensToRead, O_RDONLY);
    }
    if (opensToWrite != NULL) {
        Open(opensToWrite, O_WRONLY);
    }
    if (meetsAt != NULL) {
        Meet();
    }
    Note("end");
    return result;
}

static uint32_t Start(void) { return Work("start", startReturns); }

static uint32_t ApplyHostProfile(void) { return Work("apply", applyReturns); }

static void Append(const char** list, const char* text) {
    int i = 0;
    while (list[i] != NULL) {
        ++i;
    }
    if (i + 1 >= most) {
        abort();
    }
    list[i] = text;
}

/* What a key of the description stands for: a list, a text or a number, one of them. */
struct Key {
    const char* key;
    const char** list;
    const char** text;
    uint32_t* number;
};

static const struct Key keys[] = {
    {"name", NULL, &name, NULL},
    {"requires", requires, NULL, NULL},
    {"provides", provides, NULL, NULL},
    {"plugin_version", NULL, &metadata.pluginVersion, NULL},
    {"required_flags", requiredFlags, NULL, NULL},
    {"disabling_flags", disablingFlags, NULL, NULL},
    {"start", NULL, NULL, &startReturns},
    {"apply", NULL, NULL, &applyReturns},
    {"creates", NULL, &creates, NULL},
    {"opens_to_read", NULL, &opensToRead, NULL},
    {"opens_to_write", NULL, &opensToWrite, NULL},
    {"meets_at", NULL, &meetsAt, NULL},
};

static void Take(const char* key, const char* value) {
    for (size_t i = 0; i < sizeof keys / sizeof keys[0]; ++i) {
        if (strcmp(keys[i].key, key) != 0) {
            continue;
        }
        if (keys[i].list != NULL) {
            Append(keys[i].list, value);
        } else if (keys[i].text != NULL) {
            *keys[i].text = value;
        } else {
            *keys[i].number = (uint32_t)strtoul(value, NULL, 10);
        }
    }
    if (strcmp(key, "version") == 0) {
        metadata.version = (int32_t)strtol(value, NULL, 10);
    } else if (strcmp(key, "run_once") == 0) {
        metadata.runOnce = (uint8_t)strtoul(value, NULL, 10);
    } else if (strcmp(key, "meets") == 0) {
        meets = strtol(value, NULL, 10);
    } else if (strcmp(key, "start") == 0) {
        operations.start = Start;
    } else if (strcmp(key, "apply") == 0) {
        operations.applyHostProfile = ApplyHostProfile;
    } else if (strcmp(key, "null_lists") == 0) {
        metadata.requires = metadata.provides = NULL;
        metadata.requiredFlags = metadata.disablingFlags = NULL;
    }
}

__attribute__((constructor)) static void Describe(void) {
    char* rest = description;
    for (char* line; (line = strsep(&rest, "\n")) != NULL;) {
        char* value = strchr(line, ' ');
        if (value != NULL) {
            *value = '\0';
            Take(line, value + 1);
        }
    }
}
