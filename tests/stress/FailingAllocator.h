// Global operator new of the allocation-failure test: counts allocations and can make the Nth
// one (counted from arming) throw std::bad_alloc.
#ifndef ZIN_TEST_STRESS_FAILINGALLOCATOR_H
#define ZIN_TEST_STRESS_FAILINGALLOCATOR_H

#include <atomic>
#include <cstdint>

namespace ZinStress {

/// From now on, count allocations; the `failAt`-th one (1-based) throws std::bad_alloc, once.
void armAllocationFailure(uint64_t failAt);
extern std::atomic<bool> armed;    // false stops the counting
extern std::atomic<bool> failed;   // whether the armed failure has been thrown
extern std::atomic<int64_t> live;  // allocations made and not yet freed, for leak checks

}  // namespace ZinStress

#endif
