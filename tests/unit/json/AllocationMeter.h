#ifndef VANTOR_JSON_TESTS_ALLOCATIONMETER_H
#define VANTOR_JSON_TESTS_ALLOCATIONMETER_H

#include <cstdint>

namespace vantor::support {

// A test program that compiles AllocationMeter.cc in has operators new that count, and that fail on
// request. The two classes here are for the thread that makes them; one of each at a time.

// Counts the bytes that are asked of operator new while it lives, freed or not: work that copies
// over and over shows here without a clock.
class AllocationMeter {
public:
    AllocationMeter();
    AllocationMeter(const AllocationMeter&) = delete;
    AllocationMeter& operator=(const AllocationMeter&) = delete;

    std::uint64_t Bytes() const;

private:
    std::uint64_t bytesBefore;
};

// Makes one call of operator new throw std::bad_alloc: the one of that number, counted from 1.
class FailingAllocation {
public:
    explicit FailingAllocation(std::uint64_t number);
    ~FailingAllocation();
    FailingAllocation(const FailingAllocation&) = delete;
    FailingAllocation& operator=(const FailingAllocation&) = delete;

    bool HasFailed() const;
};

}  // namespace vantor::support

#endif
