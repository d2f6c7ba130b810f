#ifndef VANTOR_PLUGINS_TESTS_FAKEPLUGIN_H
#define VANTOR_PLUGINS_TESTS_FAKEPLUGIN_H

#include <functional>
#include <string>

#include "plugins/Plugin.h"

namespace vantor::support {

// A plugin whose methods count their calls and then do what the test asked for.
class FakePlugin : public Plugin {
public:
    explicit FakePlugin(const std::string& pluginName) : Plugin(pluginName) {}

    void Start() override {
        ++starts;
        if (onStart) {
            onStart();
        }
    }

    bool SupportsHostProfile() const override { return supportsHostProfile; }

    void ApplyHostProfile() override {
        ++applications;
        if (onApply) {
            onApply();
        }
    }

    // The description, which a kind of plugin has from its file.
    using Plugin::disablingFlags;
    using Plugin::pluginVersion;
    using Plugin::requiredFlags;
    using Plugin::runOnce;

    using Plugin::Provide;
    using Plugin::Require;

    bool supportsHostProfile = false;
    std::function<void()> onStart;
    std::function<void()> onApply;
    int starts = 0;
    int applications = 0;
};

}  // namespace vantor::support

#endif
