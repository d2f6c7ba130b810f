#include "plugins/HostProfile.h"

#include <sys/stat.h>

#include "graph/GlobalLock.h"

namespace vantor {

namespace {

constexpr const char* hostProfileFile = "/etc/nuvex/hostprofile.xml";
constexpr const char* compressedHostProfileFile = "/etc/nuvex/hostprofile.xml.gz";

// Boost's own status() has times of 32 bits on a 32-bit host: it takes a file of the time after
// 2038 for one that cannot be read.
bool Exists(const char* path) {
    struct stat status {};
    return stat(path, &status) == 0;
}

}  // namespace

bool HostProfilePresent() {
    static bool checked = false;
    static bool present = false;
    const GlobalLockGuard guard;
    if (!checked) {
        present = Exists(hostProfileFile) || Exists(compressedHostProfileFile);
        checked = true;
    }
    return present;
}

}  // namespace vantor
