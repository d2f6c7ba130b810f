#ifndef VANTOR_ANALYZE_BOOT_DOTMODEL_H
#define VANTOR_ANALYZE_BOOT_DOTMODEL_H

#include <istream>
#include <string>

#include "model/BootModel.h"

namespace vantor::analyze {

// Reads a drawing that `vantor --dump-dependency-tree` has made: the plugins that its boot would
// have requested, in load order, and their barriers. Names stand in a drawing as they are, quotes
// included, so they are read from the line's ends. Kinds, flags and fates are not in a drawing:
// every plugin is taken for a native one that runs. Of a filtered plugin only the barriers that it
// requires are seen; it is left out. Throws std::runtime_error that names `path`, the line and the
// reason for whatever is no such drawing.
BootModel ReadDotModel(const std::string& path);
BootModel ParseDotModel(std::istream& stream, const std::string& path);

}  // namespace vantor::analyze

#endif
