/*
 * Closes the ports. On a host with a host profile its rules come from there: "apply_host_profile"
 * is then run in place of "start". Such a method needs version 2 of the interface.
 */
#include "sample_host.h"

#include <vantor/plugin.h>

static uint32_t set_rules(const char* rules) {
    return host_has("links") ? host_leave("firewall", rules) : 1;
}

VANTOR_METHOD(set_default_rules) { return set_rules("default rules"); }

VANTOR_METHOD(set_profile_rules) { return set_rules("rules of the host profile"); }

static const char* const needs[] = {"network", NULL};
static const char* const gives[] = {"firewall", NULL};

VANTOR_OPERATIONS_WITH_HOST_PROFILE(set_default_rules, set_profile_rules);
VANTOR_METADATA_2(needs, gives);
