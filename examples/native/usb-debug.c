/* A debug console over USB, only for hosts booted with --plugin-flags=usb. */
#include "sample_host.h"

#include <vantor/plugin.h>

VANTOR_METHOD(open_console) { return host_leave("usb-console", "open"); }

static const char* const gives[] = {"usb", NULL};
static const char* const flags[] = {"usb", NULL};

VANTOR_OPERATIONS(open_console);
VANTOR_METADATA_3(NULL, gives, NULL, 0, flags, NULL);
