#include "basekit/CommandRunner.h"

#include <poll.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "basekit/Descriptor.h"
#include "basekit/SpawnProgram.h"

namespace BaseKit::impl {

namespace {

// How often to look after the program where the kernel cannot tell its end.
constexpr int watchMilliseconds = 20;

// One of the program's output streams.
struct Stream {
    Descriptor readEnd;
    BoundedText& kept;

    // Reads once, up to `limit` bytes. Returns how many; 0 when there is nothing, and then the
    // stream is closed if nothing can come any more.
    std::size_t ReadOnce(std::size_t limit) {
        std::array<char, 65536> buffer;
        const ssize_t size = read(readEnd.Get(), buffer.data(), std::min(limit, buffer.size()));
        if (size > 0) {
            kept.Append({buffer.data(), static_cast<std::size_t>(size)});
            return static_cast<std::size_t>(size);
        }
        if (size == 0 || (errno != EAGAIN && errno != EINTR)) {
            readEnd.Close();
        }
        return 0;
    }

    // Reads what is in the pipe at this moment, and no more than that: a child in the background
    // may write faster than it can be read.
    void ReadWhatIsThere() {
        int available = 0;
        if (!readEnd.IsOpen() || ioctl(readEnd.Get(), FIONREAD, &available) != 0) {
            return;
        }
        auto left = static_cast<std::size_t>(std::max(available, 0));
        while (left > 0) {
            const std::size_t size = ReadOnce(left);
            if (size == 0) {
                return;
            }
            left -= size;
        }
    }
};

// A running program. It is waited for in the end whatever happens, so that no zombie remains.
class Running {
public:
    Running(pid_t processArg, Descriptor output, Descriptor error, ProcessResult& resultArg)
        : process(processArg),
          result(resultArg),
          standardOutput{std::move(output), result.standardOutput},
          standardError{std::move(error), result.standardError},
          exitNotice(static_cast<int>(syscall(SYS_pidfd_open, process, 0))) {}

    Running(const Running&) = delete;
    Running& operator=(const Running&) = delete;

    ~Running() {
        standardOutput.readEnd.Close();  // or the program could wait for a reader for ever
        standardError.readEnd.Close();
        while (!ended) {
            Reap(0);
        }
    }

    void CollectUntilEnd() {
        const int timeout = exitNotice.IsOpen() ? -1 : watchMilliseconds;
        while (!ended) {
            pollfd watched[] = {{standardOutput.readEnd.Get(), POLLIN, 0},
                                {standardError.readEnd.Get(), POLLIN, 0},
                                {exitNotice.Get(), POLLIN, 0}};
            (void)poll(watched, std::size(watched), timeout);  // failed: what follows never blocks
            // Asked before the streams are read: if it has ended, all that it wrote is in the
            // pipes.
            Reap(WNOHANG);
            for (Stream* stream : {&standardOutput, &standardError}) {
                if (ended) {
                    stream->ReadWhatIsThere();
                } else if (stream->readEnd.IsOpen()) {
                    stream->ReadOnce(outputLimit);
                }
            }
        }
    }

private:
    void Reap(int options) {
        int status = 0;
        const pid_t reaped = waitpid(process, &status, options);
        if (reaped == process) {
            ended = true;
            result.end = WIFSIGNALED(status) ? ProcessEnd::Killed : ProcessEnd::Exited;
            result.code = WIFSIGNALED(status) ? WTERMSIG(status) : WEXITSTATUS(status);
        } else if (reaped < 0 && errno != EINTR) {
            // With SIGCHLD ignored, say, the kernel throws the status away.
            ended = true;
            result.end = ProcessEnd::Unknown;
            result.code = errno;
        }
    }

    const pid_t process;
    bool ended = false;
    ProcessResult& result;
    Stream standardOutput;
    Stream standardError;
    Descriptor exitNotice;  // readable once the program has ended; none on an old kernel
};

}  // namespace

ProcessResult RunProgram(std::vector<std::string> arguments) {
    ProcessResult result;
    Descriptor input;
    Descriptor outputReader;
    Descriptor outputWriter;
    Descriptor errorReader;
    Descriptor errorWriter;
    result.code = OpenNullDevice(input);
    if (result.code != 0) {
        result.obstacle = nullDevice;
        return result;
    }
    result.code = OpenPipe(outputReader, outputWriter);
    if (result.code == 0) {
        result.code = OpenPipe(errorReader, errorWriter);
    }
    if (result.code != 0) {
        result.obstacle = "a pipe for its output";
        return result;
    }
    pid_t process = -1;
    result.code =
        SpawnProgram(arguments, {input.Get(), outputWriter.Get(), errorWriter.Get()}, process);
    if (result.code != 0) {
        return result;
    }
    outputWriter.Close();
    errorWriter.Close();
    Running running(process, std::move(outputReader), std::move(errorReader), result);
    running.CollectUntilEnd();
    return result;
}

}  // namespace BaseKit::impl
