#ifndef VANTOR_ANALYZE_VERBS_COMMONOPTIONS_H
#define VANTOR_ANALYZE_VERBS_COMMONOPTIONS_H

#include <CLI/CLI.hpp>
#include <optional>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "image/DirectoryReader.h"
#include "image/HostImage.h"
#include "verbs/Invocation.h"

namespace vantor::analyze {

// The options by which a verb is told which plugins a boot would load: [DIRECTORY] or --directory,
// --root, --plugin-flags, --disable-plugins, --run-once.
struct BootSource {
    std::string root;
    BootOptions options;

    HostImage Image() const { return HostImage(root); }
};

// Adds them to a verb. `source` lives as long as the verb. The directory is the verb's argument, or
// where it takes others an option.
enum class DirectoryAs { Argument, Option };
void AddBootOptions(CLI::App& verb, BootSource& source, DirectoryAs directory);

// For options whose value names a file: refuses an empty one.
CLI::Validator HasName();

// Tells on `error`, in a line, that reading the plugins has found errors, if it has: for verbs that
// do their work without the plugins concerned.
void TellUnread(const Findings& findings, const Invocation& invocation);

// Which boot a verb is to look at, and where its plugins came from: [LOG], and a plugin directory
// (the options above) or --dot with a drawing that `vantor --dump-dependency-tree` has made.
struct LogSource {
    std::string log;  // a path of this machine; empty: the host's own
    std::string dot;  // a path of this machine; empty: the plugin directory
    BootSource plugins;

    // Reads both. Plugins that could not be read are told in the timeline's remarks, and so is a
    // directory that is not there, when none was asked for. Throws std::runtime_error or
    // std::system_error when the log, or what was asked for, cannot be read.
    BootTimeline Read() const;
    // The same, with a line on a terminal when it takes long.
    BootTimeline Read(const Invocation& invocation) const;

private:
    BootLog ReadLog() const;
    BootModel ReadModel(std::vector<std::string>& remarks) const;
};

// The plugins of the host's directory. Where nobody has named another one and it cannot be read,
// `remarks` says so and there are none. Errors in plugins are told in `remarks` too. Throws as
// ReadPlugins().
std::optional<BootModel> ReadPluginsIfThere(const BootSource& source,
                                            std::vector<std::string>& remarks);

// Adds them to a verb whose argument is the log. `source` lives as long as the verb.
void AddLogOptions(CLI::App& verb, LogSource& source);

}  // namespace vantor::analyze

#endif
