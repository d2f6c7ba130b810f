#include "platform/NvkCtl.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>

// The host's system alerts as lines of a file: "<UTC time> <text>".
namespace {

constexpr const char* alertFolders[] = {"/var", "/var/run", "/var/run/nuvex"};
constexpr const char* alertFile = "/var/run/nuvex/system-alerts";

// Line ends inside a text would let one alert look like two.
std::string OneLine(const std::string& text) {
    std::string line = text;
    for (char& c : line) {
        if (c == '\n' || c == '\r') {
            c = ' ';
        }
    }
    return line;
}

std::string UtcNow() {
    const std::time_t now = std::time(nullptr);
    std::tm utc{};
    char text[sizeof "-2147481748-12-31T23:59:60Z"] = "";
    if (gmtime_r(&now, &utc) != nullptr) {
        std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &utc);
    }
    return text;
}

// O_APPEND and a single write keep the lines of several processes whole. O_NONBLOCK keeps a FIFO
// in the file's place from stopping the boot.
void Append(const std::string& line) {
    for (const char* folder : alertFolders) {
        (void)mkdir(folder, 0755);
    }
    const int fd =
        open(alertFile, O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, 0644);
    if (fd < 0) {
        return;
    }
    const ssize_t written = write(fd, line.data(), line.size());
    (void)written;  // an alert that cannot be kept must not become the caller's failure
    close(fd);
}

}  // namespace

namespace NvkCtl::System {

SystemInfoImpl::SystemInfoImpl() {}

SystemInfoImpl::~SystemInfoImpl() {}

void SystemInfoImpl::SetSystemAlert(const std::string& text) {
    const int savedErrno = errno;
    try {
        Append(UtcNow() + " " + OneLine(text) + "\n");
    } catch (...) {
        // Out of memory: an alert is lost, the boot goes on.
    }
    errno = savedErrno;
}

}  // namespace NvkCtl::System
