#ifndef VANTOR_ANALYZE_VERIFY_WORDING_H
#define VANTOR_ANALYZE_VERIFY_WORDING_H

#include <cstddef>
#include <string>
#include <vector>

#include "model/BootModel.h"

namespace vantor::analyze {

// How findings and explanations name things.

// A plugin's name between apostrophes, a barrier's between double quotes, as the boot logs them.
std::string Quoted(const PluginDescription& plugin);
std::string QuotedBarrier(const std::string& name);

// "'a', 'b' and 'c'", in the order given; a name that is there twice, twice.
std::string Enumerate(const BootModel& model, const std::vector<std::size_t>& plugins);
std::string Enumerate(const std::vector<std::string>& phrases);

// "1 plugin", "2 plugins".
std::string Counted(std::size_t number, const std::string& noun);

// PATH, PATH:LINE or PATH:LINE:COLUMN, as far as it is known.
std::string Spelled(const Place& place);

// Where a plugin names a barrier in a list of its own; its file when the place in it is not known.
Place PlaceOf(const PluginDescription& plugin, const std::vector<BarrierName>& list,
              const std::string& barrier);

// The message that the boot logs of a plugin it does not run, without the blank at its end.
std::string Reason(const PluginDescription& plugin);

// The text with control characters written as "\xNN": it stays on its line and leaves a terminal's
// state alone.
std::string OnOneLine(const std::string& text);

}  // namespace vantor::analyze

#endif
