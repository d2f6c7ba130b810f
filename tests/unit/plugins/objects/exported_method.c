/* Does not compile: every plugin that exports a method of this name would run the first one's. */
#include <vantor/plugin.h>

uint32_t Start(void);

uint32_t Start(void) { return 0; }

#ifndef WITHOUT_TABLE
VANTOR_OPERATIONS(Start);
#endif
VANTOR_METADATA_1(NULL, NULL);
