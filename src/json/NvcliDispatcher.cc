#include "json/NvcliDispatcher.h"

#include <syslog.h>

#include <boost/make_shared.hpp>
#include <boost/shared_ptr.hpp>
#include <exception>
#include <mutex>
#include <string>

namespace vantor {

namespace {

// A lock of its own: building the dispatcher reads files, and the graph must not stand still for
// that. Guards `instance` until it is set; from then on it does not change.
std::mutex instanceMutex;
boost::shared_ptr<NvcliDispatcher> instance;

}  // namespace

NvcliDispatcher::NvcliDispatcher() {
    static const std::string directories[] = {
        "/usr/lib/nuvex/nvcli",
        "/usr/lib/nuvex/nvcli/int",
        "/usr/lib/nuvex/nvcli/int/ext",
        "/usr/lib/nuvex/nvcli/ext",
    };
    for (const std::string& directory : directories) {
        try {
            AddExternalDirectory(directory);
        } catch (const std::exception& exception) {
            syslog(LOG_ERR, "unable to add external directory to the nvcli dispatcher: %s",
                   exception.what());
        }
    }
}

NvcliDispatcher::~NvcliDispatcher() = default;

NvcliDispatcher* NvcliDispatcher::Instance() {
    const std::lock_guard<std::mutex> guard(instanceMutex);
    if (instance == nullptr) {
        instance = boost::make_shared<NvcliDispatcher>();
    }
    return instance.get();
}

}  // namespace vantor
