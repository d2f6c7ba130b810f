// A plugin whose methods throw: a standard exception, and something else.
#include <vantor/plugin.h>

#include <stdexcept>

VANTOR_METHOD(Start) { throw std::runtime_error("no disk"); }

VANTOR_METHOD(Apply) { throw 42; }

VANTOR_OPERATIONS_WITH_HOST_PROFILE(Start, Apply);
VANTOR_METADATA_2(NULL, NULL);
