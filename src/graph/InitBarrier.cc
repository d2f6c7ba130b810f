#include "graph/InitBarrier.h"

#include <boost/intrusive/set.hpp>

#include "driver/RunConfig.h"
#include "graph/GlobalLock.h"
#include "graph/SystemAlert.h"

namespace vantor {

namespace {

struct NameOf {
    // NOLINTNEXTLINE(readability-identifier-naming): the intrusive set looks for `type`
    using type = std::string;
    const type& operator()(const InitBarrier& barrier) const { return barrier.Name(); }
};

// Ascending by name, compared byte by byte. Guarded by GlobalLock. The barriers are the entries, so
// that a name is kept once; its destruction at exit leaves them as they are.
using Registry = boost::intrusive::set<InitBarrier, boost::intrusive::key_of_value<NameOf>,
                                       boost::intrusive::constant_time_size<false>>;
Registry registry;

}  // namespace

InitBarrier::InitBarrier(const std::string& barrierName) : Node(barrierName) {}

InitBarrier* InitBarrier::Get(const std::string& barrierName) {
    const GlobalLockGuard guard;
    Registry::insert_commit_data place;
    const auto [known, isNew] = registry.insert_check(barrierName, place);
    if (!isNew) {
        return &*known;
    }
    auto* const created = new InitBarrier(barrierName);
    registry.insert_commit(*created, place);
    return created;
}

std::list<InitBarrier*> InitBarrier::All() {
    const GlobalLockGuard guard;
    std::list<InitBarrier*> barriers;
    for (InitBarrier& barrier : registry) {
        barriers.push_back(&barrier);
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
