#include "boot/InputText.h"

#include <sys/stat.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <stdexcept>

#include "image/ReadFiles.h"

namespace vantor::analyze {

void ThrowTooLong(const std::string& path, std::size_t limit) {
    throw std::runtime_error(path + ": longer than any boot leaves: more than " +
                             std::to_string(limit) + " bytes");
}

std::string ReadInput(const std::string& path, std::size_t limit) {
    errno = 0;
    std::ifstream stream(path, std::ios::binary);
    if (!stream) {
        throw std::runtime_error(path + ": cannot be opened: " + std::strerror(errno));
    }
    struct stat status {};
    if (stat(path.c_str(), &status) == 0) {
        NoteRead(status);
    }
    std::string text;
    std::array<char, 65536> buffer;
    while (stream.read(buffer.data(), buffer.size()) || stream.gcount() > 0) {
        text.append(buffer.data(), static_cast<std::size_t>(stream.gcount()));
        if (text.size() > limit) {
            ThrowTooLong(path, limit);
        }
    }
    if (stream.bad()) {
        throw std::runtime_error(path + ": cannot be read: " + std::strerror(errno));
    }
    return text;
}

}  // namespace vantor::analyze
