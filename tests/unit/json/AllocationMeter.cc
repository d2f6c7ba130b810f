#include "json/AllocationMeter.h"

#include <cstddef>
#include <cstdlib>
#include <new>

namespace vantor::support {

namespace {

thread_local std::uint64_t bytesAllocated = 0;
thread_local std::uint64_t allocationsLeft = 0;  // until the one that fails; 0: none is to fail
thread_local bool allocationFailed = false;

// Null when the allocation is to fail, or does.
void* Allocate(std::size_t size) noexcept {
    if (allocationsLeft > 0 && --allocationsLeft == 0) {
        allocationFailed = true;
        return nullptr;
    }
    bytesAllocated += size;
    return std::malloc(size > 0 ? size : 1);
}

void* AllocateOrThrow(std::size_t size) {
    void* const memory = Allocate(size);
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    return memory;
}

}  // namespace

AllocationMeter::AllocationMeter() : bytesBefore(bytesAllocated) {}

std::uint64_t AllocationMeter::Bytes() const { return bytesAllocated - bytesBefore; }

FailingAllocation::FailingAllocation(std::uint64_t number) {
    allocationFailed = false;
    allocationsLeft = number;
}

FailingAllocation::~FailingAllocation() { allocationsLeft = 0; }

bool FailingAllocation::HasFailed() const { return allocationFailed; }

}  // namespace vantor::support

void* operator new(std::size_t size) { return vantor::support::AllocateOrThrow(size); }

void* operator new[](std::size_t size) { return vantor::support::AllocateOrThrow(size); }

void* operator new(std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    return vantor::support::Allocate(size);
}

void* operator new[](std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    return vantor::support::Allocate(size);
}

void operator delete(void* memory) noexcept { std::free(memory); }

void operator delete[](void* memory) noexcept { std::free(memory); }

void operator delete(void* memory, std::size_t /*size*/) noexcept { std::free(memory); }

void operator delete[](void* memory, std::size_t /*size*/) noexcept { std::free(memory); }

void operator delete(void* memory, const std::nothrow_t& /*tag*/) noexcept { std::free(memory); }

void operator delete[](void* memory, const std::nothrow_t& /*tag*/) noexcept { std::free(memory); }
