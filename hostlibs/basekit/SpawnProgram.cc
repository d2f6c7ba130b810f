#include "basekit/SpawnProgram.h"

#include <csignal>
#include <spawn.h>
#include <unistd.h>

namespace BaseKit::impl {

namespace {

// The operations of <spawn.h> return an errno value. The first that fails is kept, and after it
// nothing is tried.
class SpawnSettings {
public:
    SpawnSettings() : error(posix_spawn_file_actions_init(&actions)) {
        if (error != 0) {
            return;
        }
        error = posix_spawnattr_init(&attributes);
        if (error != 0) {
            posix_spawn_file_actions_destroy(&actions);
        }
        initialised = error == 0;
    }
    SpawnSettings(const SpawnSettings&) = delete;
    SpawnSettings& operator=(const SpawnSettings&) = delete;
    ~SpawnSettings() {
        if (initialised) {
            posix_spawnattr_destroy(&attributes);
            posix_spawn_file_actions_destroy(&actions);
        }
    }

    void TakeStreams(const std::array<int, 3>& streams) {
        for (int standard = 0; error == 0 && standard < 3; ++standard) {
            error = posix_spawn_file_actions_adddup2(
                &actions, streams[static_cast<std::size_t>(standard)], standard);
        }
        if (error == 0) {
            error = posix_spawn_file_actions_addclosefrom_np(&actions, STDERR_FILENO + 1);
        }
    }

    void ResetSignals() {
        sigset_t none;
        sigset_t all;
        sigemptyset(&none);
        sigfillset(&all);
        if (error == 0) {
            error = posix_spawnattr_setsigmask(&attributes, &none);
        }
        if (error == 0) {
            error = posix_spawnattr_setsigdefault(&attributes, &all);
        }
        if (error == 0) {
            error = posix_spawnattr_setflags(&attributes,
                                             POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
        }
    }

    int Spawn(std::vector<std::string>& arguments, pid_t& process) const {
        if (error != 0) {
            return error;
        }
        std::vector<char*> pointers;
        pointers.reserve(arguments.size() + 1);
        for (std::string& argument : arguments) {
            pointers.push_back(argument.data());
        }
        pointers.push_back(nullptr);
        return posix_spawn(&process, pointers[0], &actions, &attributes, pointers.data(), environ);
    }

private:
    posix_spawn_file_actions_t actions;
    posix_spawnattr_t attributes;
    int error = 0;
    bool initialised = false;
};

}  // namespace

int SpawnProgram(std::vector<std::string>& arguments, const std::array<int, 3>& streams,
                 pid_t& process) {
    SpawnSettings settings;
    settings.TakeStreams(streams);
    settings.ResetSignals();
    return settings.Spawn(arguments, process);
}

}  // namespace BaseKit::impl
