#ifndef VANTOR_ANALYZE_IMAGE_COMMANDDESCRIPTIONS_H
#define VANTOR_ANALYZE_IMAGE_COMMANDDESCRIPTIONS_H

#include <memory>
#include <string>

#include "image/HostImage.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// The management commands that a host's description files tell (docs/command-descriptions.md), read
// by the very code that a boot reads them with. Executes none.
class CommandDescriptions {
public:
    // Reads the host's description folders. What is wrong in them is told in `findings`.
    CommandDescriptions(const HostImage& image, Findings& findings);
    ~CommandDescriptions();
    CommandDescriptions(const CommandDescriptions&) = delete;
    CommandDescriptions& operator=(const CommandDescriptions&) = delete;

    // Tells of a command that would fail before it is executed, in the words that the boot would
    // log. A host without any of the folders has a command framework of its own, whose commands
    // nobody here knows: then nothing is told.
    void Check(const Command& command, Findings& findings) const;

private:
    struct Known;
    std::unique_ptr<Known> known;
};

}  // namespace vantor::analyze

#endif
