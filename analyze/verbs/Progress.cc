#include "verbs/Progress.h"

#include <chrono>

namespace vantor::analyze {

Progress::Progress(const Invocation& invocation, const std::string& what) {
    if (invocation.progress) {
        teller = std::thread([this, &stream = invocation.error, what] { Tell(stream, what); });
    }
}

Progress::~Progress() {
    if (teller.joinable()) {
        {
            const std::lock_guard<std::mutex> guard(mutex);
            isOver = true;
        }
        changed.notify_all();
        teller.join();
    }
}

void Progress::Tell(std::ostream& stream, const std::string& what) {
    std::unique_lock<std::mutex> guard(mutex);
    int seconds = 0;
    while (!changed.wait_for(guard, std::chrono::seconds(1), [this] { return isOver; })) {
        ++seconds;
        stream << "\r" << what << " (" << seconds << " s)" << std::flush;
    }
    if (seconds > 0) {
        stream << "\r\x1b[K" << std::flush;
    }
}

}  // namespace vantor::analyze
