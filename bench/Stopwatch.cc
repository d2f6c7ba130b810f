// Runs a program inside a folder that it takes for "/" and measures each whole run:
//
//     stopwatch ROOT SECONDS RUNS PROGRAM ARGUMENT...
//
// Prints a line a run: nanoseconds from before the program is started until it has ended, its
// microseconds of user and of system time with those of its children, and its greatest resident
// size in KiB. Fails when a run does not end with status 0 within SECONDS. The program's standard
// input is empty and its standard output is thrown away.

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

volatile pid_t running = 0;

extern "C" void EndRun(int) {
    if (running > 0) {
        kill(running, SIGKILL);
    }
}

[[noreturn]] void Fail(const char* what, int error) {
    std::fprintf(stderr, "stopwatch: %s: %s\n", what, std::strerror(error));
    std::exit(EXIT_FAILURE);
}

long Microseconds(const timeval& time) { return time.tv_sec * 1000000L + time.tv_usec; }

posix_spawn_file_actions_t WithoutStreams() {
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
    return actions;
}

void MeasureOnce(const posix_spawn_file_actions_t& actions, unsigned seconds, char** arguments) {
    char path[] = "PATH=/usr/sbin:/usr/bin";
    char* environment[] = {path, nullptr};
    const auto start = std::chrono::steady_clock::now();
    pid_t child = 0;
    const int error = posix_spawn(&child, arguments[0], &actions, nullptr, arguments, environment);
    if (error != 0) {
        Fail(arguments[0], error);
    }
    running = child;
    alarm(seconds);
    int status = 0;
    rusage usage{};
    while (wait4(child, &status, 0, &usage) < 0) {
        if (errno != EINTR) {
            Fail("wait4", errno);
        }
    }
    const std::chrono::duration<double, std::nano> taken = std::chrono::steady_clock::now() - start;
    alarm(0);
    running = 0;
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        std::fprintf(stderr, "stopwatch: %s ended with wait status %#x\n", arguments[0],
                     static_cast<unsigned>(status));
        std::exit(EXIT_FAILURE);
    }
    std::printf("%.0f %ld %ld %ld\n", taken.count(), Microseconds(usage.ru_utime),
                Microseconds(usage.ru_stime), usage.ru_maxrss);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 5) {
        std::fputs("usage: stopwatch ROOT SECONDS RUNS PROGRAM ARGUMENT...\n", stderr);
        return EXIT_FAILURE;
    }
    if (chroot(argv[1]) != 0 || chdir("/") != 0) {
        Fail(argv[1], errno);
    }
    struct sigaction action {};
    action.sa_handler = EndRun;
    sigaction(SIGALRM, &action, nullptr);
    const posix_spawn_file_actions_t actions = WithoutStreams();
    const auto seconds = static_cast<unsigned>(std::atoi(argv[2]));
    for (int i = std::atoi(argv[3]); i > 0; --i) {
        MeasureOnce(actions, seconds, argv + 4);
    }
    return EXIT_SUCCESS;
}
