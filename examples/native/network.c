/* Brings the links up. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(bring_links_up) {
    if (!host_has("nics")) {
        return 1;
    }
    host_busy(30);
    return host_leave("links", "nic0 up, nic1 up");
}

static const char* const needs[] = {"nics", NULL};
static const char* const gives[] = {"network", NULL};

VANTOR_OPERATIONS(bring_links_up);
VANTOR_METADATA_1(needs, gives);
