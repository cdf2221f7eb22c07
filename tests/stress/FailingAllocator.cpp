// The replacement of the global operator new and delete for the allocation-failure test.
#include "FailingAllocator.h"

#include <atomic>
#include <cstdlib>
#include <new>

namespace ZinStress {

namespace {

std::atomic<bool> armed{false};
std::atomic<uint64_t> counted{0};
std::atomic<uint64_t> failAtCount{0};
std::atomic<bool> failed{false};
std::atomic<int64_t> live{0};

void* allocate(std::size_t size) {
  if (armed.load(std::memory_order_relaxed)) {
    const uint64_t n = counted.fetch_add(1) + 1;
    if (n == failAtCount.load() && !failed.exchange(true)) throw std::bad_alloc();
  }
  void* p = std::malloc(size != 0 ? size : 1);
  if (p == nullptr) throw std::bad_alloc();
  live.fetch_add(1, std::memory_order_relaxed);
  return p;
}

void release(void* p) {
  if (p == nullptr) return;
  live.fetch_sub(1, std::memory_order_relaxed);
  std::free(p);
}

}  // namespace

void armAllocationFailure(uint64_t failAt) {
  counted = 0;
  failed = false;
  failAtCount = failAt;
  armed = true;
}

uint64_t disarmAllocationFailure() {
  armed = false;
  return counted.load();
}

bool allocationFailureHappened() {
  return failed.load();
}

int64_t liveAllocations() {
  return live.load();
}

}  // namespace ZinStress

void* operator new(std::size_t size) {
  return ZinStress::allocate(size);
}
void* operator new[](std::size_t size) {
  return ZinStress::allocate(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  try {
    return ZinStress::allocate(size);
  } catch (...) {
    return nullptr;
  }
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
  try {
    return ZinStress::allocate(size);
  } catch (...) {
    return nullptr;
  }
}
void operator delete(void* p) noexcept {
  ZinStress::release(p);
}
void operator delete[](void* p) noexcept {
  ZinStress::release(p);
}
void operator delete(void* p, std::size_t) noexcept {
  ZinStress::release(p);
}
void operator delete[](void* p, std::size_t) noexcept {
  ZinStress::release(p);
}
void operator delete(void* p, const std::nothrow_t&) noexcept {
  ZinStress::release(p);
}
void operator delete[](void* p, const std::nothrow_t&) noexcept {
  ZinStress::release(p);
}
