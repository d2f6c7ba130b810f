#include "graph/SystemAlert.h"

#include "platform/NvkCtl.h"

namespace vantor {

void RaiseSystemAlert(const std::string& text) noexcept {
    try {
        NvkCtl::System::SystemInfoImpl systemInfo;
        systemInfo.SetSystemAlert(text);
    } catch (...) {
        // The host's library is not ours: what it throws ends here.
    }
}

}  // namespace vantor
