// The state of a JTAG session and the session registry (internal to the JTAG library).
#ifndef ZINJTAG_ZINJTAG_SESSION_H
#define ZINJTAG_ZINJTAG_SESSION_H

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <memory>
#include <mutex>
#include <thread>

#include "ZinRT/ZinJtag.h"

/// One open session. Shared between the registry and every target lock that holds it, so a
/// session closed while locked stays valid until its last lock is released.
struct ZinJtagSessionState {
  explicit ZinJtagSessionState(uint32_t h, std::shared_ptr<ZinRT::Zin_Transport> t)
      : handle(h), transport(std::move(t)) {}

  const uint32_t handle;
  const std::shared_ptr<ZinRT::Zin_Transport> transport;
  std::recursive_mutex transportMutex;  // serialises the transfers of the session

  // Message handler; messages are delivered one at a time and in order.
  std::recursive_mutex messageMutex;
  ZinJtag_MessageHandler handler = nullptr;
  void* handlerUser = nullptr;

  // Re-entrant target lock.
  std::mutex lockMutex;
  std::condition_variable lockReleased;
  std::thread::id owner;
  uint32_t depth = 0;
  uint64_t lockCount = 0;
  bool closed = false;  // set by close while it holds the lock; later lockers fail

  std::atomic<bool> closing{false};
};

namespace ZinJtagDetail {

/// The session of `handle`; throws std::invalid_argument naming `caller` for an unknown handle.
std::shared_ptr<ZinJtagSessionState> findSession(uint32_t handle, const char* caller);

}  // namespace ZinJtagDetail

#endif
