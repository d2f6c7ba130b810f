#include "boot/InputText.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <stdexcept>

namespace vantor::analyze {

std::string ReadInput(const std::string& path, std::size_t limit) {
    errno = 0;
    std::ifstream stream(path, std::ios::binary);
    if (!stream) {
        throw std::runtime_error(path + ": cannot be opened: " + std::strerror(errno));
    }
    std::string text;
    std::array<char, 65536> buffer;
    while (stream.read(buffer.data(), buffer.size()) || stream.gcount() > 0) {
        text.append(buffer.data(), static_cast<std::size_t>(stream.gcount()));
        if (text.size() > limit) {
            throw std::runtime_error(path + ": longer than any boot leaves: more than " +
                                     std::to_string(limit) + " bytes");
        }
    }
    if (stream.bad()) {
        throw std::runtime_error(path + ": cannot be read: " + std::strerror(errno));
    }
    return text;
}

}  // namespace vantor::analyze
