#ifndef VANTOR_PLUGINS_PLUGIN_H
#define VANTOR_PLUGINS_PLUGIN_H

#include <sys/time.h>

#include <cstdint>
#include <deque>
#include <list>
#include <set>
#include <string>

#include "graph/Node.h"

namespace vantor {

// A unit of boot-time work: a node of the dependency graph that waits for the barriers it requires
// and is waited for by the barriers it provides. The kinds differ in where their description comes
// from and in what Start() and ApplyHostProfile() do. A kind's constructor fills the description
// and links the plugin; after that only Run() writes to it, on the one worker that runs it.
class Plugin : public Node {
public:
    explicit Plugin(std::string pluginName);

    // Runs the method that this boot asks of the plugin: "start", "apply_host_profile" where the
    // host has a profile and the plugin supports one, or the method named on the command line.
    // Prompts before it in interactive mode, traces and times it, and contains whatever it throws:
    // a plugin that failed counts as run. Called without GlobalLock.
    void Run() override;

    std::string DotAttributes() const override;

    ~Plugin() override;

    // Runs the plugin's "start" method. May throw anything.
    virtual void Start() = 0;

    // Whether the plugin has an apply-host-profile method.
    virtual bool SupportsHostProfile() const = 0;

    // Runs the plugin's "apply_host_profile" method. Throws NotImplementedException where there is
    // none, or anything else.
    virtual void ApplyHostProfile() = 0;

    // The version of the description format that the plugin declared; -1 until its kind sets it.
    virtual std::int32_t ApiVersion() const;

    const std::set<std::string>& RequiredFlags() const { return requiredFlags; }
    const std::set<std::string>& DisablingFlags() const { return disablingFlags; }
    bool RunOnce() const { return runOnce; }
    const std::string& PluginVersion() const { return pluginVersion; }

    // Wall-clock times just before and just after the last run of the method; zero for a plugin
    // that did not run or was skipped. To be read once the node is done.
    const timeval& StartTime() const { return startTime; }
    const timeval& EndTime() const { return endTime; }

    // Microseconds between the two, kept in signed 32 bits: the value wraps for a run of more than
    // about 35 minutes.
    std::int64_t ElapsedMicroseconds() const;

protected:
    // Link the plugin to the barriers of these names, in order, creating those that are new.
    void Provide(const std::list<std::string>& barriers);
    void Require(const std::list<std::string>& barriers);

    std::int32_t apiVersion = -1;
    bool runOnce = false;                  // to run only once for each plugin version
    std::string pluginVersion;             // the plugin's own version text
    std::set<std::string> requiredFlags;   // boot flags that must all be set
    std::set<std::string> disablingFlags;  // boot flags any of which keeps the plugin out

private:
    void RunMethod();

    timeval startTime{};
    timeval endTime{};
};

// Plugins in load order. The queue does not own them: they live until the process ends.
using PluginQueue = std::deque<Plugin*>;

}  // namespace vantor

#endif
