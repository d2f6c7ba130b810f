#ifndef VANTOR_ANALYZE_VERIFY_DRAWING_H
#define VANTOR_ANALYZE_VERIFY_DRAWING_H

#include <cstddef>
#include <ostream>
#include <string>
#include <vector>

#include "model/BootGraph.h"

namespace vantor::analyze {

// Which of a graph's nodes a drawing shows: a value for each, 0 for those left out.
using Shown = std::vector<char>;

Shown Everything(const BootGraph& graph);

// The centres, and all that is at most `depth` edges before or behind one of them: what they wait
// for, and what waits for them.
Shown Neighbourhood(const BootGraph& graph, const std::vector<Digraph::Node>& centres,
                    std::size_t depth);

// Writes the graph in the DOT language (https://graphviz.org/doc/info/lang.html). The same plugins
// give the same bytes: a node's id is its kind and name, "plugin:NAME" or "barrier:NAME", and the
// further plugins of one name are "plugin2:NAME" and so on. Barriers are boxes, dashed when nobody
// provides them; plugins that do not run are grey, cycles that the boot hangs on are red.
// `graph`: of GraphScope::All.
void WriteDrawing(const BootGraph& graph, const Shown& shown, std::ostream& stream);

// The text as the inside of a DOT label: what would end it or have a meaning of its own there is
// escaped, control characters and bytes that are no UTF-8 become "\xNN" to be read.
std::string EscapeLabel(const std::string& text);

}  // namespace vantor::analyze

#endif
