// Feeds the reader of native plugins whatever libFuzzer makes up: as a plugin of its own kind of
// machine, and as one for a boot of another kind; and as a library, and as the linker's cache.

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>

#include "image/Linkage.h"
#include "image/LinkerCache.h"
#include "image/NativeDescription.h"

namespace {

using vantor::analyze::Architecture;
using vantor::analyze::Findings;
using vantor::analyze::NativeReading;

// Whatever is not described is explained, and what is described without a word of explanation has a
// version that there is.
void CheckReading(const std::string& content, const Architecture& boot) {
    Findings findings;
    const std::optional<NativeReading> reading =
        ReadNative(content, boot, {{"x.so", 0, 0}, "/x.so"}, findings);
    const bool described =
        reading && reading->plugin.apiVersion >= 1 && reading->plugin.apiVersion <= 4;
    if (!described && findings.empty()) {
        std::fprintf(stderr, "a plugin that is neither described nor rejected\n");
        std::abort();
    }
}

// What is read stays within the file: no list is longer than it.
void CheckLinkage(const std::string& content) {
    try {
        const vantor::analyze::ElfFile file(content);
        const vantor::analyze::Linkage linkage{vantor::analyze::SharedObject(file)};
        if (linkage.needed.size() > content.size() ||
            linkage.requiredVersions.size() > content.size()) {
            std::fprintf(stderr, "more libraries than bytes\n");
            std::abort();
        }
    } catch (const vantor::analyze::ElfError&) {
        // That is what damaged files are for.
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string content(data, data + size);
    const Architecture other{1, 1, 3};
    CheckReading(content, vantor::analyze::ArchitectureOf(content).value_or(other));
    CheckReading(content, other);
    CheckLinkage(content);
    const vantor::analyze::LinkerCache cache("glibc-ld.so.cache1.1" + content, other.byteOrder);
    cache.Find("libc.so.6");
    return 0;
}
