#ifndef VANTOR_IO_TESTS_IOFAULTS_H
#define VANTOR_IO_TESTS_IOFAULTS_H

#include <gtest/gtest.h>

#include "support/FaultPoint.h"

namespace vantor::support {

// The calls of the C library that the tests of io/ make fail, one fault point each. They see the
// calls of our own objects; what the C++ library calls itself goes past them.
struct IoFaults {
    FaultPoint mkstemp;
    FaultPoint rename;
    FaultPoint stat;
    FaultPoint chmod;
    FaultPoint fsync;
    FaultPoint unlink;
    FaultPoint open;
    FaultPoint close;
    FaultPoint snprintf;
    FaultPoint allocation;  // operator new[] that answers with null
    FaultPoint fork;
    FaultPoint pipe2;
    FaultPoint setsid;
    FaultPoint waitpid;
    FaultPoint read;
    FaultPoint closeRange;  // the system calls, made through syscall(2)
    FaultPoint listFolder;
    FaultPoint sysconf;

    void Reset();
};

IoFaults& Faults();

// Every test starts and ends without a planned fault.
class IoTest : public ::testing::Test {
protected:
    IoTest() { Faults().Reset(); }
    ~IoTest() override { Faults().Reset(); }
};

}  // namespace vantor::support

#endif
