#ifndef VANTOR_ANALYZE_IMAGE_LINKERCACHE_H
#define VANTOR_ANALYZE_IMAGE_LINKERCACHE_H

#include <map>
#include <string>
#include <vector>

namespace vantor::analyze {

// The dynamic linker's cache of a host, as ldconfig(8) writes it since the GNU C library 2.2, also
// behind a table of the older kind: which files there are of a library's name.
class LinkerCache {
public:
    static constexpr const char* path = "/etc/ld.so.cache";

    // `byteOrder` is ELFDATA2LSB or ELFDATA2MSB. What is no cache, or damaged, has no entries, or
    // those before the damage.
    LinkerCache(const std::string& content, unsigned char byteOrder);

    // Paths of the host, of all word sizes: those for all processors in the linker's order, and
    // behind them those for single kinds.
    const std::vector<std::string>& Find(const std::string& name) const;

private:
    std::map<std::string, std::vector<std::string>> entries;
};

}  // namespace vantor::analyze

#endif
