#include "image/LinkerCache.h"

#include <cstdint>
#include <string_view>

#include "image/ElfBytes.h"

namespace vantor::analyze {

namespace {

constexpr std::string_view magic = "glibc-ld.so.cache1.1";

// The header, and the offsets in it and in an entry.
constexpr std::uint64_t countOffset = 20;
constexpr std::uint64_t headerSize = 48;
constexpr std::uint64_t entrySize = 24;
constexpr std::uint64_t nameOffset = 4;
constexpr std::uint64_t pathOffset = 8;
constexpr std::uint64_t processorOffset = 16;

}  // namespace

LinkerCache::LinkerCache(const std::string& content, unsigned char byteOrder) {
    if (content.compare(0, magic.size(), magic) != 0) {
        return;
    }
    const ElfBytes bytes(content, byteOrder);
    const auto text = [&](std::uint64_t place) {
        const std::uint64_t start = bytes.Number(place, 4).value_or(content.size());
        const std::size_t end = start < content.size()
                                    ? content.find('\0', static_cast<std::size_t>(start))
                                    : std::string::npos;
        return end == std::string::npos ? std::string()
                                        : content.substr(static_cast<std::size_t>(start),
                                                         end - static_cast<std::size_t>(start));
    };
    const std::uint64_t count = bytes.Number(countOffset, 4).value_or(0);
    for (std::uint64_t i = 0; i < count; ++i) {
        const std::uint64_t entry = headerSize + i * entrySize;
        const auto processor = bytes.Number(entry + processorOffset, 8);
        if (!processor) {
            return;
        }
        if (*processor == 0) {
            entries[text(entry + nameOffset)].push_back(text(entry + pathOffset));
        }
    }
}

const std::vector<std::string>& LinkerCache::Find(const std::string& name) const {
    static const std::vector<std::string> none;
    const auto found = entries.find(name);
    return found == entries.end() ? none : found->second;
}

}  // namespace vantor::analyze
