/*
 * Makes the host's identity on its very first boot. A run-once plugin: vantor records
 * "identity1.2", the init scripts hand the record back at the next boot with --run-once, and the
 * plugin runs again only when its version changes.
 */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(make_identity) {
    if (!host_has("disks")) {
        return 1;
    }
    host_busy(30);
    return host_leave("identity", "host-0001");
}

static const char* const needs[] = {"storage", NULL};
static const char* const gives[] = {"identity", NULL};

VANTOR_OPERATIONS(make_identity);
VANTOR_METADATA_3(needs, gives, "1.2", 1, NULL, NULL);
