#include "analyze/boot/BootText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

namespace vantor::support {

using analyze::PluginFate;

namespace {

constexpr analyze::Microseconds begin = 1'700'000'000'000'000;

// The barriers of a line, from its first verb on; none for a plugin that the model does not know.
bool AddBarriers(std::istringstream& words, std::string word, analyze::PluginDescription& plugin) {
    std::vector<analyze::BarrierName>* list = nullptr;
    for (bool more = !word.empty(); more; more = static_cast<bool>(words >> word)) {
        if (word == "unknown") {
            return false;
        }
        if (word == "requires" || word == "provides") {
            list = word == "requires" ? &plugin.required : &plugin.provided;
        } else {
            list->push_back({word, {}});
        }
    }
    return true;
}

}  // namespace

BootText::BootText(std::initializer_list<const char*> lines) {
    log.start = begin;
    log.end = begin;
    log.parallel = true;
    for (const char* line : lines) {
        std::istringstream words(line);
        analyze::PluginDescription plugin;
        std::string word;
        words >> plugin.name >> word;
        analyze::LogEntry entry{plugin.name, 0, 0};
        plugin.fate = word == "filtered" ? PluginFate::Filtered : PluginFate::Runs;
        const bool isLogged = word != "filtered" && word != "unlogged";
        if (isLogged && word != "idle") {
            entry.start = begin + std::stoll(word);
            words >> word;
            entry.end = begin + std::stoll(word);
            log.end = std::max(log.end, entry.end);
        }
        if (isLogged) {
            log.entries.push_back(entry);
        }
        word.clear();
        words >> word;
        if (AddBarriers(words, word, plugin)) {
            model.plugins.push_back(plugin);
        }
    }
    model.LinkBarriers();
}

std::size_t EntryOf(const analyze::BootTimeline& timeline, const std::string& name) {
    for (std::size_t entry = 0; entry < timeline.entries.size(); ++entry) {
        if (timeline.entries[entry].name == name) {
            return entry;
        }
    }
    ADD_FAILURE() << "no entry " << name;
    return 0;
}

}  // namespace vantor::support
