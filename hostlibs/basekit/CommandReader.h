#ifndef VANTOR_BASEKIT_COMMANDREADER_H
#define VANTOR_BASEKIT_COMMANDREADER_H

#include "basekit/CommandDescription.h"
#include "basekit/JsonDocument.h"

namespace BaseKit::impl {

// Reads the description of one command at `where` in the document `file`. Null, with a mistake for
// each slip, unless the whole of it is good.
AutoCli::CommandPointer ReadCommand(const Json& value, const JsonPointer& where,
                                    const std::string& file, Mistakes& mistakes);

}  // namespace BaseKit::impl

#endif
