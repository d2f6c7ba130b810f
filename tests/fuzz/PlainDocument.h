#ifndef VANTOR_FUZZ_PLAINDOCUMENT_H
#define VANTOR_FUZZ_PLAINDOCUMENT_H

#include <string>
#include <vector>

#include "json/JSONPlugin.h"
#include "json/JsonValue.h"

namespace vantor::support {

// The rules of a plugin document, told a second time over the value that it holds.

// The reason for which the document is rejected first; empty for one that is accepted.
std::string RejectionReason(const JsonValue& root);

// What of the plugin is not as its document says; empty when all of it is. For a document that is
// accepted.
std::string CompareWithDocument(const JSONPlugin& plugin, const JsonValue& root);

// Every barrier that the document may have linked.
std::vector<std::string> BarriersOf(const JsonValue& root);

}  // namespace vantor::support

#endif
