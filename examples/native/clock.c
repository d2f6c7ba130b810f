/* Sets the clock from the network. Nobody waits for it. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(set_clock) {
    host_busy(45);
    return host_has("links") ? 0 : 1;
}

static const char* const needs[] = {"network", NULL};

VANTOR_OPERATIONS(set_clock);
VANTOR_METADATA_1(needs, NULL);
