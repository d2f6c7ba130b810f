#ifndef VANTOR_ANALYZE_CHART_TIMETEXT_H
#define VANTOR_ANALYZE_CHART_TIMETEXT_H

#include <string>

#include "boot/BootLog.h"

namespace vantor::analyze {

// A length of time for a glance, three digits or so: "870 µs", "12.3 ms", "1.25 s", "2 min 05 s",
// "3 h 07 min", "12 d 4 h". Any value; a negative one begins with "-".
std::string RoundedTime(Microseconds time);

// A length of time to the microsecond: "12.345 ms" below a second, "65.000250 s" from there on.
std::string ExactTime(Microseconds time);

}  // namespace vantor::analyze

#endif
