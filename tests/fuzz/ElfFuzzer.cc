// Feeds the reader of native plugins whatever libFuzzer makes up: as a plugin of its own kind of
// machine, and as one for a boot of another kind.

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>

#include "image/NativeDescription.h"

namespace {

using vantor::analyze::Architecture;
using vantor::analyze::Findings;
using vantor::analyze::NativeReading;

// Whatever is not described is explained, and what is described has a version that there is.
void CheckReading(const std::string& content, const Architecture& boot) {
    Findings findings;
    const std::optional<NativeReading> reading =
        ReadNative(content, boot, {{"x.so", 0, 0}, "/x.so"}, findings);
    const bool described =
        reading && reading->plugin.apiVersion >= 1 && reading->plugin.apiVersion <= 4;
    if (!described && (reading || findings.empty())) {
        std::fprintf(stderr, "a plugin that is neither described nor rejected\n");
        std::abort();
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string content(data, data + size);
    const Architecture other{1, 1, 3};
    CheckReading(content, vantor::analyze::ArchitectureOf(content).value_or(other));
    CheckReading(content, other);
    return 0;
}
