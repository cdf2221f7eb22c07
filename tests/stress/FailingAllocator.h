// Global operator new of the allocation-failure test: counts allocations and can make the Nth
// one (counted from arming) throw std::bad_alloc.
#ifndef ZIN_TEST_STRESS_FAILINGALLOCATOR_H
#define ZIN_TEST_STRESS_FAILINGALLOCATOR_H

#include <cstdint>

namespace ZinStress {

/// From now on, count allocations; the `failAt`-th one (1-based) throws std::bad_alloc, once.
void armAllocationFailure(uint64_t failAt);
void disarmAllocationFailure();
/// Whether the armed failure has been thrown.
bool allocationFailureHappened();
/// Allocations made and not yet freed, for leak checks.
int64_t liveAllocations();

}  // namespace ZinStress

#endif
