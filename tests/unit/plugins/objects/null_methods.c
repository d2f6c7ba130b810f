/* A plugin with nothing to do: both entries are null. */
#include <vantor/plugin.h>

VANTOR_EXPORTED_ const struct vantor_operations operations;
const struct vantor_operations operations = {NULL, NULL};

VANTOR_METADATA_2(NULL, NULL);
