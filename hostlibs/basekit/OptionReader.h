#ifndef VANTOR_BASEKIT_OPTIONREADER_H
#define VANTOR_BASEKIT_OPTIONREADER_H

#include <string_view>
#include <vector>

#include "basekit/CommandDescription.h"
#include "basekit/JsonDocument.h"

namespace BaseKit::impl {

// Reads one option of a command at `where` in the document and puts it behind `options`, whose
// names and letters it must not have. Notes a mistake for each slip.
void ReadOption(const Json& value, const JsonPointer& where, Mistakes& mistakes,
                std::vector<AutoCli::CommandOption>& options);

// Letters, digits, "-", "_" and ".", the first a letter or a digit.
bool IsName(std::string_view text);

// One line of text without control characters; may be empty.
bool IsOneLine(std::string_view text);

}  // namespace BaseKit::impl

#endif
