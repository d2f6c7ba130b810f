"""A boot of a few plugins: the plugins, and the log and the drawing of one that has taken place."""

SLEEPER = """
#include <stddef.h>
#include <time.h>
#include <vantor/plugin.h>
VANTOR_METHOD(start) {
    const struct timespec pause = {%(milliseconds)d / 1000, %(milliseconds)d %% 1000 * 1000000L};
    return nanosleep(&pause, NULL);
}
static const char* const needs[] = {%(requires)s NULL};
static const char* const gives[] = {%(provides)s NULL};
VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(needs, gives);
"""

#  disks --> [storage] --+--> datastore --> [datastores] --> guests
#                        +--> scrub
#  nics ---> [nics] ---> network              logs, clock, keys, users: on their own
SLEEPERS = {
    "disks": (400, [], ["storage"]), "datastore": (500, ["storage"], ["datastores"]),
    "guests": (600, ["datastores"], []), "scrub": (300, ["storage"], []),
    "nics": (300, [], ["nics"]), "network": (400, ["nics"], []), "logs": (500, [], []),
    "clock": (300, [], []), "keys": (400, [], []), "users": (300, [], []),
}

#  disks 0-40 --> [storage] --> look 50-90       slow 0-30
LOG = """NVKernel Initialization Time: 12000000
[2024-03-05 07:08:09.001000 - 2024-03-05 07:08:09.041000] sysboot: disks
[2024-03-05 07:08:09.051000 - 2024-03-05 07:08:09.091000] sysboot: look
[2024-03-05 07:08:09.001000 - 2024-03-05 07:08:09.031000] sysboot: slow
=== Vantor configuration info ===
 Start: 2024-03-05 07:08:09.000000
 End: 2024-03-05 07:08:09.100000
 Verbose: 0
 Parallel: 1
 Randomize: 0
 Interactive Mode: 0
 Random Seed: 5
"""
DOT = """digraph g {
1 [label="disks"];
1 -> 4;
2 [label="look"];
3 [label="slow"];
4 [label="storage" shape=box];
4 -> 2;
}
"""

# A host whose plugins are not there, and what is said of that.
NO_HOST = "--root=/nonexistent"
NO_PLUGINS = ("note: /nonexistent/usr/libexec/vantor/plugins: No such file or directory: nothing is "
              "known of the plugins' barriers\n")


def lay_out(root):
    for name, (milliseconds, required, provided) in SLEEPERS.items():
        root.compiled(name, SLEEPER % {
            "milliseconds": milliseconds,
            "requires": "".join(f'"{barrier}", ' for barrier in required),
            "provides": "".join(f'"{barrier}", ' for barrier in provided)})
