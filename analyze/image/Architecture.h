#ifndef VANTOR_ANALYZE_IMAGE_ARCHITECTURE_H
#define VANTOR_ANALYZE_IMAGE_ARCHITECTURE_H

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "image/HostImage.h"

namespace vantor::analyze {

// What kind of processor and word size an ELF file is made for. Nothing here depends on the
// processor that this program runs on.
struct Architecture {
    unsigned char wordClass = 0;  // ELFCLASS32 or ELFCLASS64
    unsigned char byteOrder = 0;  // ELFDATA2LSB or ELFDATA2MSB
    std::uint16_t machine = 0;    // EM_...

    std::size_t WordSize() const;    // in bytes
    std::size_t HeaderSize() const;  // of the file's first header
    std::size_t SegmentHeaderSize() const;

    // For messages: "32-bit Intel 80386", say.
    std::string Text() const;

    friend bool operator==(const Architecture& left, const Architecture& right) {
        return left.Key() == right.Key();
    }
    friend bool operator!=(const Architecture& left, const Architecture& right) {
        return !(left == right);
    }
    friend bool operator<(const Architecture& left, const Architecture& right) {
        return left.Key() < right.Key();
    }

private:
    std::uint32_t Key() const;
};

// As many bytes of a file's beginning as ArchitectureOf() looks at.
constexpr std::size_t architectureBytes = 20;

// Empty for what is no ELF file.
std::optional<Architecture> ArchitectureOf(std::string_view content);

// Finds out which architecture a boot is of: the boot program's, where the image has one, else the
// one that most of the plugins are of.
class ArchitectureVote {
public:
    void Count(const Architecture& architecture) { ++votes[architecture]; }

    // Of equally many the least. Empty when none was counted.
    std::optional<Architecture> Winner() const;

private:
    std::map<Architecture, std::size_t> votes;
};

// That of the image's own boot program.
std::optional<Architecture> ProgramArchitecture(const HostImage& image);

}  // namespace vantor::analyze

#endif
