/*
 * How to write a native plugin for vantor, the boot-time service orchestrator.
 *
 * A native plugin is a shared object lib<name>.so in the plugin directory that exports two data
 * objects: "operations", the table of its methods, and "metadata", its description. In C:
 *
 *     #include <vantor/plugin.h>
 *
 *     VANTOR_METHOD(start_storage) {
 *         return 0;
 *     }
 *
 *     static const char *const needs[] = {"devices-found", NULL};
 *     static const char *const gives[] = {"storage-ready", NULL};
 *
 *     VANTOR_OPERATIONS(start_storage);
 *     VANTOR_METADATA_1(needs, gives);
 *
 * and built with: cc -shared -fPIC -o libstorage.so storage.c
 *
 * The same source is valid C++ (from C++11 on).
 *
 * All plugins of a boot live in one process, and their exported symbols are visible to each other:
 * of two exported functions named "start", both plugins would call the one that was loaded first.
 * VANTOR_METHOD therefore defines a function that is local to its file, and VANTOR_OPERATIONS does
 * not compile with any other. Keep your own helpers local too ("static", or -fvisibility=hidden).
 *
 * In parallel mode methods of different plugins run at the same time, on threads with the default
 * stack. A C++ method may throw: a std::exception is logged with its text, anything else as an
 * unknown exception, and the boot goes on.
 */
#ifndef VANTOR_PLUGIN_H
#define VANTOR_PLUGIN_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * A list of names: pointers to NUL-terminated byte strings, ended by a null pointer. A null list is
 * an empty one. Lists and strings must stay valid until the process ends.
 */
typedef const char* const* vantor_names;

/* "requires" is a keyword from C++20 on; there the field goes by another name. */
#if defined(__cplusplus) && __cplusplus > 201703L
#define VANTOR_REQUIRES_FIELD required_barriers
#else
#define VANTOR_REQUIRES_FIELD requires
#endif

/*
 * A method. Called at most once a boot, without arguments, on a thread of vantor's. Returns 0 for
 * success; any other value is logged, and the boot goes on as after a success.
 */
typedef uint32_t (*vantor_method)(void);

/*
 * The exported object "operations": the entry table.
 */
struct vantor_operations {
    /* The "start" method, run at boot. Null: nothing to do. */
    vantor_method start;
    /*
     * The "apply_host_profile" method, run in place of "start" on a host that has a host profile.
     * Looked at only when the metadata's version is 2 or more. Null: the plugin has none, and
     * "start" is run on such a host too.
     */
    vantor_method apply_host_profile;
};

/*
 * The exported object "metadata" as versions 1 and 2 have it. vantor reads no further than this for
 * those versions.
 */
struct vantor_metadata_1 {
    /* Version of this interface that the plugin is written to: 1 or 2 here. */
    int32_t version;
    /* Names of the barriers that this plugin waits for. */
    vantor_names VANTOR_REQUIRES_FIELD;
    /* Names of the barriers that wait for this plugin. */
    vantor_names provides;
};

/*
 * The exported object "metadata" as versions 3 and 4 have it. Version 4 adds nothing.
 */
struct vantor_metadata_3 {
    /* As above; 3 or 4 here. */
    int32_t version;
    vantor_names VANTOR_REQUIRES_FIELD;
    vantor_names provides;
    /*
     * The plugin's own version, any text; may be null. Together with the plugin's name it is the
     * key under which a run-once plugin is recorded, so keep to ASCII letters, digits and "-._+":
     * other characters are dropped from the record, and the plugin is then never recognised.
     */
    const char* plugin_version;
    /* Not 0: to be run only once for each plugin version. */
    uint8_t run_once;
    /* Boot flags that must all be set for the plugin to be run. */
    vantor_names required_flags;
    /* Boot flags any one of which keeps the plugin from being run. */
    vantor_names disabling_flags;
};

#ifdef __cplusplus
}
#define VANTOR_STATIC_ASSERT_(condition, text) static_assert(condition, text)
#define VANTOR_EXPORTED_ extern "C" __attribute__((visibility("default")))
#else
#define VANTOR_STATIC_ASSERT_(condition, text) _Static_assert(condition, text)
#define VANTOR_EXPORTED_ extern __attribute__((visibility("default")))
#endif

/* vantor and its plugins are built apart: the layout is the agreement, at both word sizes. */
#define VANTOR_ASSERT_OFFSET_(type, field, offset32, offset64)                                     \
    VANTOR_STATIC_ASSERT_(offsetof(struct type, field) ==                                          \
                              (sizeof(void*) == 4 ? offset32##U : offset64##U),                    \
                          "unexpected offset of " #field)

VANTOR_ASSERT_OFFSET_(vantor_operations, start, 0, 0);
VANTOR_ASSERT_OFFSET_(vantor_operations, apply_host_profile, 4, 8);
VANTOR_ASSERT_OFFSET_(vantor_metadata_1, version, 0, 0);
VANTOR_ASSERT_OFFSET_(vantor_metadata_1, VANTOR_REQUIRES_FIELD, 4, 8);
VANTOR_ASSERT_OFFSET_(vantor_metadata_1, provides, 8, 16);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, version, 0, 0);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, VANTOR_REQUIRES_FIELD, 4, 8);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, provides, 8, 16);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, plugin_version, 12, 24);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, run_once, 16, 32);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, required_flags, 20, 40);
VANTOR_ASSERT_OFFSET_(vantor_metadata_3, disabling_flags, 24, 48);

/*
 * Begins the definition of a method: VANTOR_METHOD(name) { ...; return 0; }
 */
#define VANTOR_METHOD(name) static uint32_t name(void)

/*
 * Each plugin has one of the VANTOR_OPERATIONS and one of the VANTOR_METADATA lines, at file scope.
 * Methods are named, not null; write the object out to export a table with a null start entry.
 */

/* Exports a table with a start method alone. */
#define VANTOR_OPERATIONS(start)                                                                   \
    VANTOR_METHOD(start);                                                                          \
    VANTOR_EXPORTED_ const struct vantor_operations operations;                                    \
    const struct vantor_operations operations = {start, NULL}

/* Exports a table with both methods; for version 2 and above. */
#define VANTOR_OPERATIONS_WITH_HOST_PROFILE(start, apply_host_profile)                             \
    VANTOR_METHOD(start);                                                                          \
    VANTOR_METHOD(apply_host_profile);                                                             \
    VANTOR_EXPORTED_ const struct vantor_operations operations;                                    \
    const struct vantor_operations operations = {start, apply_host_profile}

#define VANTOR_METADATA_SHORT_(version, needs, gives)                                              \
    VANTOR_EXPORTED_ const struct vantor_metadata_1 metadata;                                      \
    const struct vantor_metadata_1 metadata = {version, needs, gives}

#define VANTOR_METADATA_LONG_(version, needs, gives, plugin_version, run_once, required_flags,     \
                              disabling_flags)                                                     \
    VANTOR_EXPORTED_ const struct vantor_metadata_3 metadata;                                      \
    const struct vantor_metadata_3 metadata = {                                                    \
        version, needs, gives, plugin_version, run_once, required_flags, disabling_flags}

/*
 * Export the description in the layout of the named version. needs and gives are lists of barrier
 * names (vantor_names, or NULL); the other arguments are those of the fields above.
 */
#define VANTOR_METADATA_1(needs, gives) VANTOR_METADATA_SHORT_(1, needs, gives)
#define VANTOR_METADATA_2(needs, gives) VANTOR_METADATA_SHORT_(2, needs, gives)
#define VANTOR_METADATA_3(needs, gives, plugin_version, run_once, required_flags, disabling_flags) \
    VANTOR_METADATA_LONG_(3, needs, gives, plugin_version, run_once, required_flags,               \
                          disabling_flags)
#define VANTOR_METADATA_4(needs, gives, plugin_version, run_once, required_flags, disabling_flags) \
    VANTOR_METADATA_LONG_(4, needs, gives, plugin_version, run_once, required_flags,               \
                          disabling_flags)

#endif
