#include "plugins/VirtualTerminal.h"

#include <fcntl.h>
#include <linux/vt.h>
#include <sys/ioctl.h>

#include "io/FileDescriptor.h"

namespace vantor {

void SwitchToVirtualTerminal(int number) {
    const FileDescriptor console(open("/dev/console", O_RDWR | O_CLOEXEC | O_NOCTTY));
    if (!console.IsOpen()) {
        return;
    }
    if (ioctl(console.Get(), VT_ACTIVATE, number) != 0) {
        (void)ioctl(console.Get(), VT_WAITACTIVE, number);
    }
}

}  // namespace vantor
