// Ctrl-C as a request to stop a loop (watch), instead of ending the process.
#ifndef ZINMOX_TOOL_INTERRUPT_H
#define ZINMOX_TOOL_INTERRUPT_H

#include <chrono>

namespace zinmox {

/// While alive, SIGINT sets a flag instead of ending the process; the previous handler comes
/// back when it is destroyed.
class InterruptGuard {
 public:
  InterruptGuard();
  ~InterruptGuard();
  InterruptGuard(const InterruptGuard&) = delete;
  InterruptGuard& operator=(const InterruptGuard&) = delete;

  bool interrupted() const;
  /// Sleeps for `duration` or until Ctrl-C, whichever comes first; returns interrupted().
  bool sleepFor(std::chrono::milliseconds duration) const;

 private:
  void (*previous_)(int);
};

}  // namespace zinmox

#endif
