#ifndef VANTOR_ANALYZE_IMAGE_DOCUMENTDESCRIPTION_H
#define VANTOR_ANALYZE_IMAGE_DOCUMENTDESCRIPTION_H

#include <optional>
#include <string>

#include "image/NativeDescription.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// Reads the document of a JSON plugin as the boot does, and finds out where its parts stand. What
// the boot would reject, or never be done with, is told in `findings` and gives no description. The
// description lacks a name and a fate.
std::optional<PluginDescription> ReadDocument(const std::string& content,
                                              const PluginSource& source, Findings& findings);

// Tells of a document that cannot be opened, as the boot would.
void RejectMissingDocument(const PluginSource& source, Findings& findings);

}  // namespace vantor::analyze

#endif
