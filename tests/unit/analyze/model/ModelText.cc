#include "analyze/model/ModelText.h"

#include <algorithm>
#include <random>
#include <sstream>
#include <stdexcept>

namespace vantor::analyze {

BootModel ModelOf(const std::vector<std::string>& lines) {
    BootModel model;
    for (const std::string& line : lines) {
        PluginDescription plugin;
        plugin.name = line.substr(0, line.find(':'));
        plugin.place.path = "/p/" + plugin.name;
        std::istringstream words(line.substr(line.find(':') + 1));
        std::vector<BarrierName>* list = &plugin.required;
        for (std::string word; words >> word;) {
            if (word == ">") {
                list = &plugin.provided;
            } else {
                list->push_back({word, {}});
            }
        }
        model.plugins.push_back(std::move(plugin));
    }
    model.LinkBarriers();
    return model;
}

PluginDescription& PluginOf(BootModel& model, const std::string& name) {
    const auto found =
        std::find_if(model.plugins.begin(), model.plugins.end(),
                     [&](const PluginDescription& plugin) { return plugin.name == name; });
    if (found == model.plugins.end()) {
        throw std::invalid_argument("no plugin " + name);
    }
    return *found;
}

void Filter(BootModel& model, const std::string& name) {
    PluginDescription& plugin = PluginOf(model, name);
    plugin.fate = PluginFate::Filtered;
    plugin.fateReason = "ignoring plugin '" + name + "' due to blacklist";
}

BootModel RandomModel(std::uint32_t seed, std::size_t plugins, std::size_t barriers,
                      std::size_t links) {
    std::mt19937 random(seed);
    const auto upTo = [&random](std::size_t limit) { return random() % limit; };
    BootModel model;
    for (std::size_t i = 0; i < plugins; ++i) {
        PluginDescription plugin;
        plugin.name = "p" + std::to_string(i);
        plugin.place.path = "/p/" + plugin.name;
        for (std::vector<BarrierName>* list : {&plugin.required, &plugin.provided}) {
            for (std::size_t count = upTo(links + 1); count > 0; --count) {
                list->push_back({"b" + std::to_string(upTo(barriers)), {}});
            }
        }
        model.plugins.push_back(std::move(plugin));
    }
    model.LinkBarriers();
    return model;
}

}  // namespace vantor::analyze
