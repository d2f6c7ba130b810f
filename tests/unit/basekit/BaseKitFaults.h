#ifndef VANTOR_BASEKIT_TESTS_BASEKITFAULTS_H
#define VANTOR_BASEKIT_TESTS_BASEKITFAULTS_H

#include "support/FaultPoint.h"

namespace vantor::support {

// The calls of the C library that the tests of the command framework make fail. They see the calls
// of the library's own objects.
struct BaseKitFaults {
    FaultPoint open;
    FaultPoint pipe2;
    FaultPoint read;
    FaultPoint readdir;
    FaultPoint pidfdOpen;  // a system call, made through syscall(2)

    void Reset();
};

BaseKitFaults& Faults();

// No fault is planned before and after its life.
class FaultScope {
public:
    FaultScope() { Faults().Reset(); }
    ~FaultScope() { Faults().Reset(); }
    FaultScope(const FaultScope&) = delete;
    FaultScope& operator=(const FaultScope&) = delete;
};

}  // namespace vantor::support

#endif
