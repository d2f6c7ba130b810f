#ifndef VANTOR_BASEKIT_TESTS_DESCRIPTIONFOLDER_H
#define VANTOR_BASEKIT_TESTS_DESCRIPTIONFOLDER_H

#include <string>

#include "support/TempFolder.h"

namespace vantor::support {

// A folder of description files.
class DescriptionFolder {
public:
    const std::string& Path() const { return folder.Path(); }
    std::string File(const std::string& name) const { return folder.File(name); }

    // Writes a file with this content.
    void Write(const std::string& name, const std::string& content) const {
        WriteFile(folder.File(name), content);
    }

    // Writes a file with these commands, JSON objects with commas between them.
    void WriteCommands(const std::string& name, const std::string& commands) const {
        Write(name, "{\"commands\": [" + commands + "]}");
    }

private:
    TempFolder folder;
};

// A command that has no options.
inline std::string SimpleCommand(const std::string& path, const std::string& execute) {
    return "{\"path\": \"" + path + "\", \"summary\": \"Does it\", \"execute\": [" + execute + "]}";
}

}  // namespace vantor::support

#endif
