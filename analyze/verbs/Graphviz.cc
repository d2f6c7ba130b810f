#include "verbs/Graphviz.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <stdexcept>
#include <system_error>

#include "io/FileDescriptor.h"

namespace vantor::analyze {

namespace {

void Check(bool succeeded, const char* what) {
    if (!succeeded) {
        throw std::system_error(errno, std::generic_category(), what);
    }
}

// Lets the file hold the text, to be read from its start.
void Fill(const FileDescriptor& file, const std::string& text) {
    Check(file.IsOpen(), "cannot hold the drawing");
    for (std::size_t written = 0; written < text.size();) {
        const ssize_t count = write(file.Get(), text.data() + written, text.size() - written);
        Check(count >= 0, "cannot hold the drawing");
        written += static_cast<std::size_t>(count);
    }
    Check(lseek(file.Get(), 0, SEEK_SET) == 0, "cannot hold the drawing");
}

pid_t Start(int input, int output) {
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, input, STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&actions, output, STDOUT_FILENO);
    std::array<std::string, 2> words = {"dot", "-Tsvg"};
    const std::array<char*, 3> arguments = {words[0].data(), words[1].data(), nullptr};
    pid_t child = 0;
    const int error = posix_spawnp(&child, "dot", &actions, nullptr, arguments.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error == ENOENT) {
        throw std::runtime_error(
            "there is no program 'dot': install Graphviz, or draw with --format=dot");
    }
    if (error != 0) {
        throw std::system_error(error, std::generic_category(), "cannot run 'dot'");
    }
    return child;
}

std::string ReadAll(int descriptor) {
    std::string text;
    std::array<char, 65536> buffer{};
    for (;;) {
        const ssize_t count = read(descriptor, buffer.data(), buffer.size());
        if (count > 0) {
            text.append(buffer.data(), static_cast<std::size_t>(count));
        } else if (count == 0 || errno != EINTR) {
            return text;
        }
    }
}

}  // namespace

std::string DrawAsSvg(const std::string& drawing) {
    const FileDescriptor input(memfd_create("drawing", MFD_CLOEXEC));
    Fill(input, drawing);
    std::array<int, 2> ends{};
    Check(pipe2(ends.data(), O_CLOEXEC) == 0, "cannot make a pipe");
    const FileDescriptor readEnd(ends[0]);
    FileDescriptor writeEnd(ends[1]);
    const pid_t child = Start(input.Get(), writeEnd.Get());
    writeEnd.Close();
    std::string svg = ReadAll(readEnd.Get());
    int status = 0;
    while (waitpid(child, &status, 0) < 0) {
        Check(errno == EINTR, "cannot wait for 'dot'");
    }
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        throw std::runtime_error("'dot' could not draw the graph");
    }
    return svg;
}

}  // namespace vantor::analyze
