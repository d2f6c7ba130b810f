#ifndef VANTOR_JSON_PLUGINDOCUMENT_H
#define VANTOR_JSON_PLUGINDOCUMENT_H

#include <cstddef>
#include <cstdint>
#include <istream>
#include <list>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "plugins/Exceptions.h"

namespace vantor {

// Where in a document a value stands, or would stand.
struct DocumentPlace {
    std::vector<std::string> keys;       // from the root; none for the root itself
    std::optional<std::size_t> element;  // of the array at those keys
};

// A document that cannot be used. The message is that of every unusable plugin file.
class DocumentRejection : public InvalidPluginException {
public:
    DocumentRejection(const std::string& path, const std::string& reason, DocumentPlace where);

    // What was found wrong.
    const DocumentPlace& Place() const { return place; }

private:
    DocumentPlace place;
};

// The description and the commands that a plugin document holds.
struct PluginDocument {
    std::int32_t apiVersion = -1;
    std::list<std::string> provided;  // names of barriers, in document order
    std::list<std::string> required;
    std::set<std::string> requiredFlags;              // empty below version 3
    std::set<std::string> disablingFlags;             // empty below version 3
    bool runOnce = false;                             // false below version 3
    std::string pluginVersion;                        // empty below version 3
    std::list<std::string> startCommands;             // in document order
    std::list<std::string> applyHostProfileCommands;  // empty below version 2
};

// First version of a document in which "apply_host_profile" is looked at.
constexpr std::int32_t hostProfileDocumentVersion = 2;

// Reads and checks the document at `path` and fills `document`, which is fresh. Throws
// DocumentRejection with `path` and the first thing that is wrong; what stands before that in the
// order of the fields has been filled in, a list only when all of it is good.
void ReadPluginDocument(const std::string& path, PluginDocument& document);

// The same for the bytes of a stream. `path` is what a rejection names.
void ReadPluginDocument(std::istream& stream, const std::string& path, PluginDocument& document);

}  // namespace vantor

#endif
