#ifndef VANTOR_NVCLI_NVCLI_H
#define VANTOR_NVCLI_NVCLI_H

#include <ostream>
#include <string>
#include <vector>

// The program nvcli: tries one command line of the host's command framework by hand.
namespace nvcli {

enum ExitStatus {
    Success = 0,
    Failure = 1,         // the command failed, or descriptions to be shown are bad
    BadCommandLine = 2,  // nothing was executed
};

// The whole program. Results go to `output`, errors to `errors`, each line of ours starting with
// "nvcli: ". A bad description is always reported, but it only changes the exit status when help
// was asked for: when a command is executed, its outcome is what counts.
ExitStatus RunNvcli(const std::vector<std::string>& arguments, std::ostream& output,
                    std::ostream& errors);

}  // namespace nvcli

#endif
