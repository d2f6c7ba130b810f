#ifndef VANTOR_ANALYZE_MODELTEXT_H
#define VANTOR_ANALYZE_MODELTEXT_H

#include <cstdint>
#include <string>
#include <vector>

#include "model/BootModel.h"

namespace vantor::analyze {

// A model of a line for each plugin: "NAME: REQUIRED... > PROVIDED...", as in "b: x y > z". The
// file of NAME is "/p/NAME". Barriers are linked.
BootModel ModelOf(const std::vector<std::string>& lines);

// A plugin of the model by its name.
PluginDescription& PluginOf(BootModel& model, const std::string& name);

// Keeps it from running, as a list of disabled plugins does.
void Filter(BootModel& model, const std::string& name);

// A model of so many plugins and barriers, each plugin with up to `links` names in each of its
// lists; the same seed gives the same model.
BootModel RandomModel(std::uint32_t seed, std::size_t plugins, std::size_t barriers,
                      std::size_t links);

}  // namespace vantor::analyze

#endif
