/* A plugin whose methods report failures. */
#include <vantor/plugin.h>

VANTOR_METHOD(Start) { return 5; }

VANTOR_METHOD(Apply) { return 4294967295U; }

VANTOR_OPERATIONS_WITH_HOST_PROFILE(Start, Apply);
VANTOR_METADATA_2(NULL, NULL);
