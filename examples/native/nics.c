/* Loads the drivers of the network cards. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(load_drivers) {
    host_busy(50);
    return host_leave("nics", "nic0 nic1");
}

static const char* const gives[] = {"nics", NULL};

VANTOR_OPERATIONS(load_drivers);
VANTOR_METADATA_1(NULL, gives);
