#ifndef VANTOR_ANALYZE_IMAGE_ELFBYTES_H
#define VANTOR_ANALYZE_IMAGE_ELFBYTES_H

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace vantor::analyze {

// Numbers of one byte order in the bytes of a file.
class ElfBytes {
public:
    // `byteOrder` is ELFDATA2LSB or ELFDATA2MSB. The bytes outlive this object.
    ElfBytes(std::string_view fileBytes, unsigned char byteOrder);

    std::uint64_t Size() const { return bytes.size(); }

    // The unsigned number of `size` bytes, at most 8, at an offset; empty outside of the file.
    std::optional<std::uint64_t> Number(std::uint64_t offset, std::size_t size) const;

    // The same for a number that the caller knows to be there.
    static std::uint64_t Compose(const unsigned char* digits, std::size_t size, bool bigEndian);

    bool BigEndian() const { return bigEndian; }

private:
    std::string_view bytes;
    bool bigEndian;
};

}  // namespace vantor::analyze

#endif
