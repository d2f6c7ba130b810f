#ifndef VANTOR_DRIVER_USAGE_H
#define VANTOR_DRIVER_USAGE_H

namespace vantor {

// Writes the usage text to standard output.
void PrintUsage();

}  // namespace vantor

#endif
