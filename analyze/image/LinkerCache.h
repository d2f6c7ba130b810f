#ifndef VANTOR_ANALYZE_IMAGE_LINKERCACHE_H
#define VANTOR_ANALYZE_IMAGE_LINKERCACHE_H

#include <map>
#include <string>
#include <vector>

namespace vantor::analyze {

// The dynamic linker's cache of a host, as ldconfig(8) writes it since the GNU C library 2.2: which
// files there are of a library's name. Entries for single kinds of processor are left out: each is
// there beside one for all.
class LinkerCache {
public:
    static constexpr const char* path = "/etc/ld.so.cache";

    // `byteOrder` is ELFDATA2LSB or ELFDATA2MSB. What is no cache, or damaged, has no entries, or
    // those before the damage.
    LinkerCache(const std::string& content, unsigned char byteOrder);

    // Paths of the host, in the linker's order; of all word sizes.
    const std::vector<std::string>& Find(const std::string& name) const;

private:
    std::map<std::string, std::vector<std::string>> entries;
};

}  // namespace vantor::analyze

#endif
