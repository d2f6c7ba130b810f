#include "io/ChildProcess.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

[[noreturn]] void Fail(int reportPipe, ChildStep step) {
    const ChildOutcome outcome{step, errno};
    const ssize_t written = write(reportPipe, &outcome, sizeof outcome);
    (void)written;  // without the pipe only the report is lost
    _exit(1);
}

[[noreturn]] void BecomeProgram(const ChildSetup& setup, int limit, int reportPipe) {
    if (setup.newSession && setsid() < 0) {
        Fail(reportPipe, ChildStep::Session);
    }
    KeptDescriptors kept = setup.kept;
    kept.Add(reportPipe);
    CloseDescriptors(setup.closeFrom, limit, kept);
    if (setup.takeTerminal) {
        (void)ioctl(STDIN_FILENO, TIOCSCTTY, 1);
    }
    execve(setup.path, setup.arguments, setup.environment);
    Fail(reportPipe, ChildStep::Exec);
}

ChildOutcome ReadOutcome(int reportPipe) {
    ChildOutcome outcome;
    ssize_t size = 0;
    do {
        size = read(reportPipe, &outcome, sizeof outcome);
    } while (size < 0 && errno == EINTR);
    // End of file: exec closed the pipe. A record is far below PIPE_BUF, so it comes whole.
    return size == static_cast<ssize_t>(sizeof outcome) ? outcome : ChildOutcome{};
}

}  // namespace

ChildOutcome RunChild(const ChildSetup& setup) {
    int ends[2] = {-1, -1};
    if (pipe2(ends, O_CLOEXEC) != 0) {
        // The program is worth more than the report of its failure.
        ends[0] = ends[1] = -1;
    }
    const FileDescriptor readEnd(ends[0]);
    FileDescriptor writeEnd(ends[1]);
    const int limit = OpenFileLimit();

    const pid_t child = fork();
    if (child < 0) {
        return {ChildStep::Fork, errno};
    }
    if (child == 0) {
        BecomeProgram(setup, limit, writeEnd.Get());
    }
    writeEnd.Close();
    const ChildOutcome outcome = readEnd.IsOpen() ? ReadOutcome(readEnd.Get()) : ChildOutcome{};
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    return outcome;
}

}  // namespace vantor
