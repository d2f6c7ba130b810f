/* A plugin of the long record with every list and the version text null. */
#include <vantor/plugin.h>

VANTOR_METHOD(Start) { return 0; }

VANTOR_OPERATIONS(Start);
VANTOR_METADATA_3(NULL, NULL, NULL, 0, NULL, NULL);
