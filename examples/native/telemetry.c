/*
 * Requires a barrier that no plugin of this host provides: a system alert says so, and the plugin
 * runs all the same.
 */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(open_channel) { return host_leave("telemetry", "channel open"); }

static const char* const needs[] = {"licence", NULL};

VANTOR_OPERATIONS(open_channel);
VANTOR_METADATA_1(needs, NULL);
