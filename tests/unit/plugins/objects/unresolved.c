/* A plugin that mentions a function which nobody has, in a method that need not be called. */
#include "plugins/objects/counted.h"

extern uint32_t FunctionThatNobodyHas(void);

/* No other object of the tests exports this. */
VANTOR_EXPORTED_ uint32_t SeenByTheWholeProcess(void);

uint32_t SeenByTheWholeProcess(void) { return 0; }

VANTOR_METHOD(Start) {
    ++callsOfStart;
    return 0;
}

VANTOR_METHOD(Apply) { return FunctionThatNobodyHas(); }

VANTOR_OPERATIONS_WITH_HOST_PROFILE(Start, Apply);
VANTOR_METADATA_2(NULL, NULL);
