/* Reads the sensors of a host whose board has none: the failure is logged and the boot goes on. */
#include "sample_host.h"

#include <vantor/plugin.h>

enum { no_controller = 5 };

VANTOR_METHOD(read_sensors) {
    host_busy(20);
    return no_controller;
}

static const char* const gives[] = {"hardware", NULL};

VANTOR_OPERATIONS(read_sensors);
VANTOR_METADATA_1(NULL, gives);
