// The SIGINT flag of watch.
#include "Interrupt.h"

#include <csignal>
#include <thread>

namespace zinmox {

namespace {

volatile std::sig_atomic_t gInterrupted = 0;

extern "C" void onInterrupt(int) {
  gInterrupted = 1;
}

}  // namespace

InterruptGuard::InterruptGuard() {
  gInterrupted = 0;
  previous_ = std::signal(SIGINT, onInterrupt);
}

InterruptGuard::~InterruptGuard() {
  std::signal(SIGINT, previous_ == SIG_ERR ? SIG_DFL : previous_);
}

bool InterruptGuard::interrupted() const {
  return gInterrupted != 0;
}

bool InterruptGuard::sleepFor(std::chrono::milliseconds duration) const {
  const auto end = std::chrono::steady_clock::now() + duration;
  while (!interrupted()) {
    const auto now = std::chrono::steady_clock::now();
    if (now >= end) break;
    std::this_thread::sleep_for(
        std::min<std::chrono::steady_clock::duration>(end - now, std::chrono::milliseconds(20)));
  }
  return interrupted();
}

}  // namespace zinmox
