/*
 * A plugin of the version OBJECT_VERSION, with every field of the longest record filled, whether or
 * not the version has it.
 */
#include "plugins/objects/counted.h"

#define TEXT_OF(number) #number
#define BARRIER(number, suffix) "version" TEXT_OF(number) suffix

VANTOR_METHOD(Start) {
    ++callsOfStart;
    return 0;
}

VANTOR_METHOD(Apply) {
    ++callsOfApply;
    return 0;
}

VANTOR_OPERATIONS_WITH_HOST_PROFILE(Start, Apply);

static const char* const needs[] = {BARRIER(OBJECT_VERSION, "-need-b"),
                                    BARRIER(OBJECT_VERSION, "-need-a"), NULL};
static const char* const gives[] = {BARRIER(OBJECT_VERSION, "-give-b"),
                                    BARRIER(OBJECT_VERSION, "-give-a"), NULL};
static const char* const requiredFlags[] = {"beta", "alpha", "beta", NULL};
static const char* const disablingFlags[] = {"nousb", "noacpi", NULL};

VANTOR_METADATA_LONG_(OBJECT_VERSION, needs, gives, "7.8", 1, requiredFlags, disablingFlags);
