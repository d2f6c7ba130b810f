#include "basekit/DescriptionLoader.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>
#include <optional>
#include <string_view>
#include <utility>

#include "basekit/CommandReader.h"
#include "basekit/Descriptor.h"
#include "basekit/JsonDocument.h"
#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

struct CloseDirectory {
    void operator()(DIR* directory) const { closedir(directory); }
};

[[noreturn]] void ThrowUnreadable(const std::string& directory, int error) {
    throw AutoCli::DescriptionError(
        {directory + ": cannot read the directory: " + ErrnoText(error)});
}

// O_NONBLOCK: a FIFO of such a name must not stop the boot.
std::optional<std::string> ReadWholeFile(const std::string& name, Mistakes& mistakes) {
    const Descriptor file(open(name.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK));
    struct stat status {};
    if (!file.IsOpen() || fstat(file.Get(), &status) != 0) {
        mistakes.Add("", "cannot read the file: " + ErrnoText(errno));
        return std::nullopt;
    }
    if (!S_ISREG(status.st_mode)) {
        mistakes.Add("", "not a regular file");
        return std::nullopt;
    }
    std::string text;
    std::array<char, 16384> buffer;
    while (true) {
        const ssize_t size = read(file.Get(), buffer.data(), buffer.size());
        if (size > 0) {
            text.append(buffer.data(), static_cast<std::size_t>(size));
        } else if (size == 0) {
            return text;
        } else if (errno != EINTR) {
            mistakes.Add("", "cannot read the file: " + ErrnoText(errno));
            return std::nullopt;
        }
    }
}

}  // namespace

DescriptionFile ReadDescriptionFile(const std::string& name) {
    Mistakes mistakes(name);
    const std::optional<std::string> text = ReadWholeFile(name, mistakes);
    if (!text.has_value()) {
        return {name, {}, std::move(mistakes)};
    }
    return ParseDescriptionFile(name, *text);
}

DescriptionFile ParseDescriptionFile(const std::string& name, const std::string& text) {
    DescriptionFile file{name, {}, Mistakes(name)};
    const std::optional<Json> document = ParseJson(text, file.mistakes);
    if (!document.has_value()) {
        return file;
    }
    JsonObject root(*document, JsonPointer(), file.mistakes);
    root.CheckKeys({"commands"});
    const Json* const commands = root.Require("commands", Json::value_t::array);
    if (commands == nullptr) {
        return file;
    }
    for (std::size_t i = 0; i < commands->size(); ++i) {
        const JsonPointer place = root.At("commands") / i;
        AutoCli::CommandPointer command = ReadCommand((*commands)[i], place, name, file.mistakes);
        if (command != nullptr) {
            file.commands.push_back({std::move(command), (place / "path").to_string()});
        }
    }
    return file;
}

bool IsDescriptionName(std::string_view name) {
    constexpr std::string_view suffix = ".json";
    return name.size() >= suffix.size() && name[0] != '.' &&
           name.substr(name.size() - suffix.size()) == suffix;
}

std::vector<std::string> ListDescriptionFiles(const std::string& directory) {
    const std::unique_ptr<DIR, CloseDirectory> listing(opendir(directory.c_str()));
    if (listing == nullptr) {
        ThrowUnreadable(directory, errno);
    }
    const std::string prefix = directory.back() == '/' ? directory : directory + "/";
    std::vector<std::string> files;
    while (true) {
        errno = 0;
        const dirent* const entry = readdir(listing.get());
        if (entry == nullptr && errno != 0) {
            ThrowUnreadable(directory, errno);
        }
        if (entry == nullptr) {
            break;
        }
        if (IsDescriptionName(entry->d_name)) {
            files.push_back(prefix + entry->d_name);
        }
    }
    std::sort(files.begin(), files.end());
    return files;
}

}  // namespace BaseKit::impl
