#ifndef VANTOR_BASEKIT_OPTIONBINDER_H
#define VANTOR_BASEKIT_OPTIONBINDER_H

#include <string>
#include <utility>
#include <vector>

#include "basekit/ArgumentTemplate.h"
#include "basekit/CommandDescription.h"

namespace BaseKit::impl {

struct BoundOptions {
    OptionValues values;
    std::vector<std::string> errors;  // sentences; with any, the values are not to be used
};

// Holds the parameters of a command line against the options of its command: unknown ones, ones
// given twice, values of the wrong kind and required ones that are missing are errors, in this
// order of the line and then of the description. A name of one letter is an option's letter.
BoundOptions BindOptions(const AutoCli::CommandDescription& command,
                         const std::vector<std::pair<std::string, std::string>>& parameters);

}  // namespace BaseKit::impl

#endif
