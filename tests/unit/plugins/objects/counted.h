#ifndef VANTOR_PLUGINS_TESTS_OBJECTS_COUNTED_H
#define VANTOR_PLUGINS_TESTS_OBJECTS_COUNTED_H

#include <vantor/plugin.h>

/* What a test asks a loaded plugin by name: how often its methods were called. */
VANTOR_EXPORTED_ uint32_t CallsOfStart(void);
VANTOR_EXPORTED_ uint32_t CallsOfApply(void);

static uint32_t callsOfStart;
static uint32_t callsOfApply;

uint32_t CallsOfStart(void) { return callsOfStart; }
uint32_t CallsOfApply(void) { return callsOfApply; }

#endif
