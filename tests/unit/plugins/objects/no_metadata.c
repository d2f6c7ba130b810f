/* A shared object with an entry table and no description. */
#include <vantor/plugin.h>

VANTOR_METHOD(Start) { return 0; }

VANTOR_OPERATIONS(Start);
