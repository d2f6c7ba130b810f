// Starts the management agent once the datastores, the firewall and the identity are there: a
// plugin in C++ that waits for several barriers.
#include "sample_host.h"

#include <vantor/plugin.h>

#include <array>
#include <string>

namespace {

const std::array<const char*, 3> prerequisites = {"datastores", "firewall", "identity"};

const char* const needs[] = {"datastores", "firewall", "identity", nullptr};
const char* const gives[] = {"management", nullptr};

}  // namespace

VANTOR_METHOD(StartAgent) {
    std::string found;
    for (const char* name : prerequisites) {
        if (host_has(name) == 0) {
            return 1;
        }
        found += found.empty() ? name : std::string(", ") + name;
    }
    host_busy(25);
    return host_leave("management", ("agent started with " + found).c_str());
}

VANTOR_OPERATIONS(StartAgent);
VANTOR_METADATA_1(needs, gives);
