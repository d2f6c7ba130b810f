#include "plugins/Plugin.h"

#include <utility>

#include "graph/InitBarrier.h"

namespace vantor {

Plugin::Plugin(std::string pluginName) : Node(std::move(pluginName)) {}

Plugin::~Plugin() = default;

std::string Plugin::DotAttributes() const { return {}; }

std::int32_t Plugin::ApiVersion() const { return apiVersion; }

std::int64_t Plugin::ElapsedMicroseconds() const {
    // Unsigned arithmetic wraps where signed arithmetic would overflow.
    const auto seconds =
        static_cast<std::uint32_t>(endTime.tv_sec) - static_cast<std::uint32_t>(startTime.tv_sec);
    const auto microseconds =
        static_cast<std::uint32_t>(endTime.tv_usec) - static_cast<std::uint32_t>(startTime.tv_usec);
    return static_cast<std::int32_t>(seconds * 1000000U + microseconds);
}

void Plugin::Provide(const std::list<std::string>& barriers) {
    for (const std::string& barrier : barriers) {
        AddDependent(*InitBarrier::Get(barrier));
    }
}

void Plugin::Require(const std::list<std::string>& barriers) {
    for (const std::string& barrier : barriers) {
        AddDependency(*InitBarrier::Get(barrier));
    }
}

}  // namespace vantor
