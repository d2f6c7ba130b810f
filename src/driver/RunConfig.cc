#include "driver/RunConfig.h"

#include <ctime>

#include "graph/GlobalLock.h"

namespace vantor {

RunConfig::RunConfig() : seed(static_cast<std::int32_t>(std::time(nullptr))) {}

RunConfig& RunConfig::Instance() {
    static RunConfig* instance = nullptr;
    const GlobalLockGuard guard;
    if (instance == nullptr) {
        instance = new RunConfig;
    }
    return *instance;
}

}  // namespace vantor
