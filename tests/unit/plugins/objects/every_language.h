#ifndef VANTOR_PLUGINS_TESTS_OBJECTS_EVERYLANGUAGE_H
#define VANTOR_PLUGINS_TESTS_OBJECTS_EVERYLANGUAGE_H

/* One plugin, compiled in every language that the interface promises. */
#include "plugins/objects/counted.h"

VANTOR_METHOD(Start) {
    ++callsOfStart;
    return 0;
}

VANTOR_METHOD(Apply) {
    ++callsOfApply;
    return 0;
}

static const char* const needs[] = {"every-language-need", NULL};
static const char* const gives[] = {"every-language-give", NULL};
static const char* const flags[] = {"flag", NULL};

VANTOR_OPERATIONS_WITH_HOST_PROFILE(Start, Apply);
VANTOR_METADATA_4(needs, gives, "1.0", 1, flags, NULL);

#endif
