#ifndef VANTOR_ANALYZE_IMAGE_COMMANDDESCRIPTIONS_H
#define VANTOR_ANALYZE_IMAGE_COMMANDDESCRIPTIONS_H

#include <memory>
#include <string>

#include "image/HostImage.h"
#include "image/Ownership.h"
#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// The management commands that a host's description files tell (docs/command-descriptions.md), read
// by the very code that a boot reads them with. Executes none.
class CommandDescriptions {
public:
    // Reads the host's description folders. What is wrong in them, and who else may write to them,
    // is told in `findings`.
    CommandDescriptions(const HostImage& image, Ownership& ownership, Findings& findings);
    ~CommandDescriptions();
    CommandDescriptions(const CommandDescriptions&) = delete;
    CommandDescriptions& operator=(const CommandDescriptions&) = delete;

    // Tells, in one finding, when there is none of the folders although plugins have commands.
    void CheckFolders(const BootModel& model, Findings& findings) const;

    // Tells of a command that would fail before it is executed, in the words that the boot would
    // log. Without any of the folders all fail, and nothing is told of each.
    void Check(const Command& command, Findings& findings) const;

private:
    struct Known;
    std::unique_ptr<Known> known;
};

}  // namespace vantor::analyze

#endif
