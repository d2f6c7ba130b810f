/* A plugin of the long record with every list there and empty. */
#include <vantor/plugin.h>

VANTOR_METHOD(Start) { return 0; }

static const char* const none[] = {NULL};

VANTOR_OPERATIONS(Start);
VANTOR_METADATA_3(none, none, "", 0, none, none);
