#include "support/ForkedChild.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <exception>
#include <stdexcept>

namespace vantor::support {

namespace {

[[noreturn]] void BeChild(const std::function<int(int report)>& body, int report) {
    int status = 99;
    try {
        status = body(report);
    } catch (const std::exception& exception) {
        WriteReport(report, exception.what());
    }
    _exit(status);
}

std::string ReadAll(int descriptor) {
    std::string text;
    char buffer[4096];
    ssize_t size = 0;
    while ((size = read(descriptor, buffer, sizeof buffer)) != 0) {
        if (size > 0) {
            text.append(buffer, static_cast<std::size_t>(size));
        } else if (errno != EINTR) {
            break;
        }
    }
    return text;
}

}  // namespace

void WriteReport(int report, const std::string& text) {
    std::size_t at = 0;
    while (at < text.size()) {
        const ssize_t size = write(report, text.data() + at, text.size() - at);
        if (size < 0 && errno != EINTR) {
            return;
        }
        at += size > 0 ? static_cast<std::size_t>(size) : 0;
    }
}

ChildReport RunForked(const std::function<int(int report)>& body) {
    int ends[2] = {-1, -1};
    if (pipe(ends) != 0) {
        throw std::runtime_error("no pipe for a child");
    }
    // What is still in the buffers would be written by both.
    (void)std::fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        close(ends[0]);
        BeChild(body, ends[1]);
    }
    close(ends[1]);
    ChildReport report;
    report.text = ReadAll(ends[0]);
    close(ends[0]);
    if (child < 0) {
        throw std::runtime_error("no child");
    }
    while (waitpid(child, &report.status, 0) < 0 && errno == EINTR) {
    }
    return report;
}

}  // namespace vantor::support
