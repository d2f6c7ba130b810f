/* Mounts the datastores once the disks are there. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(mount_datastores) {
    if (!host_has("disks")) {
        return 1;
    }
    host_busy(60);
    return host_leave("datastores", "datastore1 on disk1");
}

static const char* const needs[] = {"storage", NULL};
static const char* const gives[] = {"datastores", NULL};

VANTOR_OPERATIONS(mount_datastores);
VANTOR_METADATA_1(needs, gives);
