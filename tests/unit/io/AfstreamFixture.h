#ifndef VANTOR_IO_TESTS_AFSTREAMFIXTURE_H
#define VANTOR_IO_TESTS_AFSTREAMFIXTURE_H

#include <stdexcept>
#include <string>
#include <vector>

#include "io/IoFaults.h"
#include "io/afstream.h"
#include "support/ErrorText.h"
#include "support/TempFolder.h"

namespace vantor::support {

// A folder of its own with one destination in it, "report.log", which does not exist at first.
class AfstreamFixture : public IoTest {
protected:
    void WriteOld(const std::string& content, mode_t mode = 0644) {
        WriteFile(destination, content, mode);
    }

    std::string Content() const { return ReadFile(destination); }

    // The names beside the destination: what a stream left, or is at work on.
    std::vector<std::string> Temporaries() const {
        std::vector<std::string> names;
        for (const std::string& name : folder.Entries()) {
            if (name != "report.log") {
                names.push_back(name);
            }
        }
        return names;
    }

    // The path of the one temporary file; a remark when there is not exactly one.
    std::string TemporaryPath() const {
        const std::vector<std::string> names = Temporaries();
        return names.size() == 1 ? folder.File(names.front()) : "(not one temporary file)";
    }

    const TempFolder folder;
    const std::string destination = folder.File("report.log");
};

// The destination holds "old" with mode 644, and there is a stream to fail with.
class AfstreamFailureFixture : public AfstreamFixture {
protected:
    AfstreamFailureFixture() { WriteOld("old"); }

    std::string OpenError(const std::string& path) {
        return ErrorText<std::runtime_error>([&] { stream.open(path.c_str()); });
    }
    std::string CommitError() { return CommitError(stream); }
    static std::string CommitError(afstream& failing) {
        return ErrorText<std::runtime_error>([&] { failing.commit(); });
    }

    afstream stream;
};

}  // namespace vantor::support

#endif
