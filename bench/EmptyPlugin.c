/* The smallest useful native plugin: what loading one costs is the linker's work and vantor's. */
#include <stddef.h>
#include <vantor/plugin.h>

VANTOR_METHOD(start) { return 0; }

static const char* const none[] = {NULL};

VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(none, none);
