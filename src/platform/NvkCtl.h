#ifndef VANTOR_PLATFORM_NVKCTL_H
#define VANTOR_PLATFORM_NVKCTL_H

#include <cstddef>
#include <string>

// The operations of libnvkctl, the host's kernel-control library, that this system calls. The
// library belongs to the host; hostlibs/ has a working one for every other machine.
namespace NvkCtl::System {

// The host's system-information service. Made anew for each use, by one thread.
class SystemInfoImpl {
public:
    SystemInfoImpl();
    ~SystemInfoImpl();
    SystemInfoImpl(const SystemInfoImpl&) = delete;
    SystemInfoImpl& operator=(const SystemInfoImpl&) = delete;

    // Raises an alert that an operator finds later. A host's library may throw.
    void SetSystemAlert(const std::string& text);

private:
    // The caller provides the object's storage but does not know what the host's library keeps in
    // it: room for any plausible layout, so that another build of the library fits without a
    // rebuild of the program.
    [[maybe_unused]] alignas(std::max_align_t) unsigned char hostStorage[512];
};

}  // namespace NvkCtl::System

#endif
