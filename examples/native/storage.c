/* Finds the host's disks. Waits for nobody: the smallest plugin there is. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(find_disks) {
    host_busy(40);
    return host_leave("disks", "disk0 disk1");
}

static const char* const gives[] = {"storage", NULL};

VANTOR_OPERATIONS(find_disks);
VANTOR_METADATA_1(NULL, gives);
