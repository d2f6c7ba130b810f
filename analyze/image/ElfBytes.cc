#include "image/ElfBytes.h"

#include <elf.h>

#include <cstring>

namespace vantor::analyze {

ElfBytes::ElfBytes(std::string_view fileBytes, unsigned char byteOrder)
    : bytes(fileBytes), bigEndian(byteOrder == ELFDATA2MSB) {}

std::optional<std::uint64_t> ElfBytes::Number(std::uint64_t offset, std::size_t size) const {
    if (offset > bytes.size() || size > bytes.size() - offset) {
        return std::nullopt;
    }
    unsigned char digits[8];
    std::memcpy(digits, bytes.data() + static_cast<std::size_t>(offset), size);
    return Compose(digits, size, bigEndian);
}

std::uint64_t ElfBytes::Compose(const unsigned char* digits, std::size_t size, bool bigEndian) {
    std::uint64_t number = 0;
    for (std::size_t i = 0; i < size; ++i) {
        number = number << 8U | digits[bigEndian ? i : size - 1 - i];
    }
    return number;
}

}  // namespace vantor::analyze
