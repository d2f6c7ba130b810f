#include "plugins/SystemLog.h"

#include <syslog.h>

#include <cstddef>
#include <cstring>

namespace vantor {

void LogFormat(int priority, const std::string& text, int error) {
    std::string message;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char next = i + 1 < text.size() ? text[i + 1] : '\0';
        if (text[i] != '%' || (next != '%' && next != 'm')) {
            message += text[i];
            continue;
        }
        message += next == '%' ? "%" : std::strerror(error);
        ++i;
    }
    syslog(priority, "%s", message.c_str());
}

}  // namespace vantor
