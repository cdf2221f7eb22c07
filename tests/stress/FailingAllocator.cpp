// The replacement of the global operator new and delete for the allocation-failure test.
#include "FailingAllocator.h"

#include <atomic>
#include <cstdlib>
#include <new>

namespace ZinStress {

std::atomic<bool> armed{false}, failed{false};
std::atomic<int64_t> live{0};

namespace {

std::atomic<uint64_t> counted{0};
std::atomic<uint64_t> failAtCount{0};

}  // namespace

void armAllocationFailure(uint64_t failAt) {
  counted = 0;
  failed = false;
  failAtCount = failAt;
  armed = true;
}

}  // namespace ZinStress

// Every form is replaced, so that no allocation of this program comes from another allocator
// (a sanitizer's, say) and is then freed by these.
void* operator new(std::size_t size) {
  using namespace ZinStress;
  if (armed.load(std::memory_order_relaxed) && counted.fetch_add(1) + 1 == failAtCount.load() &&
      !failed.exchange(true)) {
    throw std::bad_alloc();
  }
  void* p = std::malloc(size != 0 ? size : 1);
  if (p == nullptr) throw std::bad_alloc();
  live.fetch_add(1, std::memory_order_relaxed);
  return p;
}
void* operator new[](std::size_t size) {
  return operator new(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  try {
    return operator new(size);
  } catch (...) {
    return nullptr;
  }
}
void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept {
  return operator new(size, tag);
}
void operator delete(void* p) noexcept {
  if (p == nullptr) return;
  ZinStress::live.fetch_sub(1, std::memory_order_relaxed);
  std::free(p);
}
void operator delete[](void* p) noexcept {
  operator delete(p);
}
void operator delete(void* p, std::size_t) noexcept {
  operator delete(p);
}
void operator delete[](void* p, std::size_t) noexcept {
  operator delete(p);
}
void operator delete(void* p, const std::nothrow_t&) noexcept {
  operator delete(p);
}
void operator delete[](void* p, const std::nothrow_t&) noexcept {
  operator delete(p);
}
