#ifndef VANTOR_IO_TESTS_PRIVILEGES_H
#define VANTOR_IO_TESTS_PRIVILEGES_H

#include <linux/capability.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <stdexcept>

namespace vantor::support {

// Lays down, for the calling thread and while it lives, the privilege to pass over permission bits,
// which root has: so that the same test holds for root and for an ordinary user.
class WithoutFilePrivileges {
public:
    WithoutFilePrivileges() {
        Call(SYS_capget, saved);
        Sets lowered = saved;
        for (const int capability : {CAP_DAC_OVERRIDE, CAP_DAC_READ_SEARCH}) {
            lowered[0].effective &= ~(1U << capability);
        }
        Call(SYS_capset, lowered);
    }
    ~WithoutFilePrivileges() { (void)TryCall(SYS_capset, saved); }
    WithoutFilePrivileges(const WithoutFilePrivileges&) = delete;
    WithoutFilePrivileges& operator=(const WithoutFilePrivileges&) = delete;

private:
    using Sets = std::array<__user_cap_data_struct, 2>;

    static long TryCall(long number, Sets& sets) {
        __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
        return syscall(number, &header, sets.data(), 0L);
    }
    static void Call(long number, Sets& sets) {
        if (TryCall(number, sets) != 0) {
            throw std::runtime_error("the thread's capabilities cannot be changed");
        }
    }

    Sets saved{};
};

}  // namespace vantor::support

#endif
