/* A shared object that describes itself but has no entry table. */
#include <vantor/plugin.h>

VANTOR_METADATA_1(NULL, NULL);
