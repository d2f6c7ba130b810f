#ifndef VANTOR_GRAPH_SYSTEMALERT_H
#define VANTOR_GRAPH_SYSTEMALERT_H

#include <string>

namespace vantor {

// Raises a system alert through the host's kernel-control library. An alert that the library
// refuses is lost: it never stops a boot.
void RaiseSystemAlert(const std::string& text) noexcept;

}  // namespace vantor

#endif
