#ifndef VANTOR_ANALYZE_VERBS_GRAPHVIZ_H
#define VANTOR_ANALYZE_VERBS_GRAPHVIZ_H

#include <string>

namespace vantor::analyze {

// Has Graphviz' program `dot`, found on the PATH, turn a drawing in the DOT language into SVG. What
// the program complains of goes to standard error. Throws std::runtime_error when there is no such
// program or it fails, std::system_error when it cannot be talked to.
std::string DrawAsSvg(const std::string& drawing);

}  // namespace vantor::analyze

#endif
