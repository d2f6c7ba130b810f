// Starts once the volume is there, and others wait for it in turn. A run-once plugin: it runs again
// only when its version changes.
#include <vantor/plugin.h>

#include <fstream>
#include <stdexcept>

namespace {

const char* const needs[] = {"kit-volume", nullptr};
const char* const gives[] = {"kit-agent", nullptr};

}  // namespace

VANTOR_METHOD(StartAgent) {
    std::ofstream boot("/var/run/kit/boot", std::ios::app);
    boot << "agent" << std::endl;
    if (!boot) {
        throw std::runtime_error("the agent finds no volume");  // logged; the boot goes on
    }
    return 0;
}

VANTOR_OPERATIONS(StartAgent);
VANTOR_METADATA_3(needs, gives, "1.0", 1, nullptr, nullptr);
