#include "graph/InitBarrier.h"

#include <map>
#include <memory>

#include "driver/RunConfig.h"
#include "graph/GlobalLock.h"
#include "graph/KeepUntilExit.h"
#include "graph/SystemAlert.h"

namespace vantor {

namespace {

// Guarded by GlobalLock. Its destruction at exit frees the entries, not the barriers.
std::map<std::string, InitBarrier*> registry;

}  // namespace

InitBarrier::InitBarrier(const std::string& barrierName) : Node(barrierName) {}

InitBarrier* InitBarrier::Get(const std::string& barrierName) {
    const GlobalLockGuard guard;
    const auto known = registry.find(barrierName);
    if (known != registry.end()) {
        return known->second;
    }
    std::unique_ptr<InitBarrier> created(new InitBarrier(barrierName));
    KeepUntilExit(*created);
    registry.emplace(barrierName, created.get());
    return created.release();
}

std::list<InitBarrier*> InitBarrier::All() {
    const GlobalLockGuard guard;
    std::list<InitBarrier*> barriers;
    for (const auto& entry : registry) {
        barriers.push_back(entry.second);
    }
    return barriers;
}

void InitBarrier::Run() {
    const GlobalLockGuard guard;
    if (!Dependencies().empty()) {
        return;
    }
    const std::string text = MissingProviderText();
    if (!RunConfig::Instance().invoke) {
        RaiseSystemAlert(text);
    }
}

std::string InitBarrier::MissingProviderText() const {
    std::string text = "Vantor dependency error: Initialization barrier \"" + Name() +
                       "\" is not provided by any plugin but the following plugins require it: ";
    const char* separator = "";
    for (const Node* dependent : Dependents()) {
        text += separator;
        text += '"' + dependent->Name() + '"';
        separator = ", ";
    }
    return text;
}

std::string InitBarrier::DotAttributes() const { return " shape=box"; }

}  // namespace vantor
