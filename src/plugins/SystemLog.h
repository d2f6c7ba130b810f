#ifndef VANTOR_PLUGINS_SYSTEMLOG_H
#define VANTOR_PLUGINS_SYSTEMLOG_H

#include <string>

namespace vantor {

// Logs `text` as syslog(3) would with `text` as its format and no further argument, where that
// means anything: "%%" becomes a percent sign and "%m" the text of `error`, an errno value. Every
// other conversion would want an argument that is not there and stays as it is written.
void LogFormat(int priority, const std::string& text, int error);

}  // namespace vantor

#endif
