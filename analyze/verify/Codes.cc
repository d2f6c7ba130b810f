#include "verify/Codes.h"

#include <algorithm>
#include <iterator>

namespace vantor::analyze {

namespace {

struct Code {
    const char* name;
    const char* description;
};

constexpr Code codes[] = {
    {"bad-command", "A command of a plugin does not fit the description of the command."},
    {"bad-description", "A command description cannot be used."},
    {"bad-object", "A shared object is damaged in a way that the linker does not look for."},
    {"bad-record", "A record of a native plugin cannot be read from its file."},
    {"cycle", "Plugins wait for each other, so that the boot never ends."},
    {"deep-nesting", "A document is nested more deeply than the boot can be sure to read."},
    {"duplicate-name", "Several plugins have the same name."},
    {"entry-twice", "A debug entry runs twice: it has a marker file and is read by itself too."},
    {"filtered-provider", "All providers of a required barrier are filtered out."},
    {"foreign-architecture", "A shared object is of another architecture than the boot program."},
    {"ignored-file", "The boot ignores a file of the plugin directory."},
    {"implied-requirement", "A requirement makes no difference beside another one."},
    {"load-order", "A shared object is loaded only if another plugin is loaded before it."},
    {"lone-slash", "A document holds a slash that begins no comment; reading it never ends."},
    {"malformed-entry", "A line of the debug configuration is no entry."},
    {"marker-without-entry", "The debug configuration holds no entry for a debug marker."},
    {"missing-library", "A library that a shared object needs is not on the host."},
    {"missing-version", "A library is older than a shared object needs it."},
    {"no-descriptions", "The host has no command descriptions, but plugins with commands."},
    {"no-provider", "A required barrier is provided by no plugin."},
    {"null-start", "A native plugin has no start method."},
    {"open-cycle", "Plugins wait for each other in boots with other options."},
    {"rejected", "The boot rejects a plugin file."},
    {"shared-key", "Run-once plugins of several names are one in the record of those that ran."},
    {"short-record", "A record of a native plugin is shorter than its version says."},
    {"taken-over", "Another object takes over a function, both export it by one name."},
    {"truncated", "A shared object ends before its contents do."},
    {"unchecked-objects", "What shared objects need of others cannot be checked."},
    {"undetermined", "A native plugin says of itself only when it is loaded what it needs."},
    {"undefined-symbol", "A shared object needs a symbol that no other object defines."},
    {"unknown-command", "No command description tells of a command of a plugin."},
    {"unsupported-version", "A plugin is of a version that the boot program does not know."},
    {"unreadable", "A file cannot be read."},
    {"unused-barrier", "No plugin requires a barrier that is provided."},
    {"writable", "Others than root may change what runs at boot."},
};

}  // namespace

std::string DescribeCode(const std::string& code) {
    const auto* const found = std::find_if(std::begin(codes), std::end(codes),
                                           [&](const Code& known) { return known.name == code; });
    return found == std::end(codes) ? std::string() : found->description;
}

}  // namespace vantor::analyze
