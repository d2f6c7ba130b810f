/* A run-once plugin of the version OBJECT_VERSION, a text. */
#include <vantor/plugin.h>

VANTOR_METHOD(Start) { return 0; }

VANTOR_OPERATIONS(Start);
VANTOR_METADATA_4(NULL, NULL, OBJECT_VERSION, 1, NULL, NULL);
