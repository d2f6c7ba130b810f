#ifndef VANTOR_ANALYZE_MODEL_BOOTMODEL_H
#define VANTOR_ANALYZE_MODEL_BOOTMODEL_H

#include <cstddef>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace vantor::analyze {

// Where something is written: a file of the host, as the host names it (without the folder that a
// mounted image lies in), and where they are known a line and a column, both counted from 1.
struct Place {
    std::string path;
    int line = 0;    // 0: not known
    int column = 0;  // in characters; 0: not known
};

// A barrier's name in one of a plugin's lists.
struct BarrierName {
    std::string name;
    Place place;
};

// A management command of a JSON plugin.
struct Command {
    std::string text;
    Place place;
};

enum class PluginKind { Native, Json, Debug };

// What a boot does with a plugin.
enum class PluginFate {
    Runs,
    Filtered,    // kept in the graph as done; not in the boot's queue and log
    AlreadyRun,  // kept in the graph as done, and in the log with zero times
};

// One plugin of a boot, as its file describes it.
struct PluginDescription {
    std::string name;
    PluginKind kind = PluginKind::Native;
    Place place;  // its file; of a debug plugin its line of the debug configuration
    std::int32_t apiVersion = 0;
    std::vector<BarrierName> provided;  // in the order of the file, repetitions kept
    std::vector<BarrierName> required;
    std::set<std::string> requiredFlags;
    std::set<std::string> disablingFlags;
    bool runOnce = false;
    std::string pluginVersion;
    std::vector<Command> commands;  // of all its methods
    PluginFate fate = PluginFate::Runs;
    std::string fateReason;  // the message that the boot logs of it; empty when it runs
};

// A barrier and who names it, as indices into the model's plugins: ascending, each once.
struct Barrier {
    std::vector<std::size_t> providers;
    std::vector<std::size_t> requirers;
};

// All plugins of one boot and the barriers between them. Plugins stand in an order that depends on
// nothing but what the directory holds: by the bytes of the file name, and behind them the debug
// entries in the order of their lines. Two of one name are possible.
struct BootModel {
    std::vector<PluginDescription> plugins;
    std::map<std::string, Barrier> barriers;  // by the bytes of the name
    std::vector<std::string> notLoaded;       // paths of plugin files that the boot rejects

    // Makes `barriers` anew from the plugins' lists.
    void LinkBarriers();
};

}  // namespace vantor::analyze

#endif
