#include "image/LinkerCache.h"

#include <cstdint>
#include <string_view>

#include "image/ElfBytes.h"

namespace vantor::analyze {

namespace {

constexpr std::string_view magic = "glibc-ld.so.cache1.1";
constexpr std::string_view olderMagic = "ld.so-1.7.0";

// The header, and the offsets in it and in an entry.
constexpr std::uint64_t countOffset = 20;
constexpr std::uint64_t headerSize = 48;
constexpr std::uint64_t entrySize = 24;
constexpr std::uint64_t nameOffset = 4;
constexpr std::uint64_t pathOffset = 8;
constexpr std::uint64_t processorOffset = 16;

}  // namespace

LinkerCache::LinkerCache(const std::string& file, unsigned char byteOrder) {
    const std::size_t begin = file.find(magic);
    const bool isFirst = begin == 0;
    if (begin == std::string::npos ||
        (!isFirst && file.compare(0, olderMagic.size(), olderMagic) != 0)) {
        return;
    }
    const std::string content = file.substr(begin);  // places are counted from here
    const ElfBytes bytes(content, byteOrder);
    std::map<std::string, std::vector<std::string>> ofSingleKinds;
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
            break;
        }
        (*processor == 0 ? entries : ofSingleKinds)[text(entry + nameOffset)].push_back(
            text(entry + pathOffset));
    }
    for (const auto& [name, paths] : ofSingleKinds) {
        std::vector<std::string>& all = entries[name];
        all.insert(all.end(), paths.begin(), paths.end());
    }
}

const std::vector<std::string>& LinkerCache::Find(const std::string& name) const {
    static const std::vector<std::string> none;
    const auto found = entries.find(name);
    return found == entries.end() ? none : found->second;
}

}  // namespace vantor::analyze
