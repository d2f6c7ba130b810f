#include "plugins/HostProfile.h"

#include <boost/filesystem/operations.hpp>

#include "graph/GlobalLock.h"

namespace vantor {

namespace {

constexpr const char* hostProfileFile = "/etc/nuvex/hostprofile.xml";
constexpr const char* compressedHostProfileFile = "/etc/nuvex/hostprofile.xml.gz";

bool Exists(const char* path) {
    boost::system::error_code error;
    const boost::filesystem::file_type type = boost::filesystem::status(path, error).type();
    return type != boost::filesystem::status_error && type != boost::filesystem::file_not_found;
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
