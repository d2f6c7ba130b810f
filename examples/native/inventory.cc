// Takes stock of the host, and throws when it cannot: vantor logs the text and goes on.
#include "sample_host.h"

#include <vantor/plugin.h>

#include <stdexcept>

namespace {

const char* const needs[] = {"management", "hardware", nullptr};

}  // namespace

VANTOR_METHOD(TakeStock) {
    if (host_has("sensors") == 0) {
        throw std::runtime_error("no sensor answers");
    }
    return host_leave("inventory", "complete");
}

VANTOR_OPERATIONS(TakeStock);
VANTOR_METADATA_1(needs, nullptr);
