#ifndef VANTOR_ANALYZE_IMAGE_HOSTIMAGE_H
#define VANTOR_ANALYZE_IMAGE_HOSTIMAGE_H

#include <string>

namespace vantor::analyze {

// A host's file system: this machine's own, or an image or chroot that lies in a folder. Knows the
// fixed paths that the boot program uses.
class HostImage {
public:
    static constexpr const char* pluginDirectory = "/usr/libexec/vantor/plugins";
    static constexpr const char* debugConfiguration = "/etc/nuvex/vantor/debug.conf";
    static constexpr const char* profilingLog = "/var/log/sysboot.log";
    static constexpr const char* commandDescriptions = "/usr/lib/nuvex/nvcli";
    static constexpr const char* program = "/usr/sbin/vantor";

    // `folder` is empty or "/" for this machine; any other is put before every path of the host.
    explicit HostImage(std::string folder = {});

    // Where a path of the host is to be opened here. A relative path is left as it is.
    std::string Open(const std::string& path) const;

    // Whether it is another one than this machine's own.
    bool IsElsewhere() const { return !root.empty(); }

private:
    std::string root;  // without a slash at its end
};

}  // namespace vantor::analyze

#endif
