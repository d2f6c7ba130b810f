/* Built twice: two plugins whose methods have the same name. */
#include "plugins/objects/counted.h"

VANTOR_METHOD(Start) {
    ++callsOfStart;
    return 0;
}

VANTOR_OPERATIONS(Start);
VANTOR_METADATA_1(NULL, NULL);
