#ifndef VANTOR_ANALYZE_VERBS_PROGRESS_H
#define VANTOR_ANALYZE_VERBS_PROGRESS_H

#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// Says on a terminal what a verb is at, once that has taken a second, and takes the line back at
// the end of its scope. Does nothing where `error` is no terminal; nobody else writes to `error`
// meanwhile.
class Progress {
public:
    // `what` is what is being done: "reading the plugins".
    Progress(const Invocation& invocation, const std::string& what);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

private:
    void Tell(std::ostream& stream, const std::string& what);

    std::mutex mutex;
    std::condition_variable changed;
    bool isOver = false;  // guarded by `mutex`
    std::thread teller;
};

}  // namespace vantor::analyze

#endif
