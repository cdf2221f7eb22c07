// The re-entrant target lock of a session.
#include <chrono>
#include <stdexcept>
#include <string>

#include "ZinJtag_Session.h"

ZinJtagTargetLock::ZinJtagTargetLock(uint32_t handle, uint32_t timeoutMs)
    : session_(ZinJtagDetail::findSession(handle, "ZinJtagTargetLock")) {
  ZinJtagSessionState& s = *session_;
  const std::thread::id self = std::this_thread::get_id();
  std::unique_lock<std::mutex> guard(s.lockMutex);
  if (s.depth != 0 && s.owner == self) {
    ++s.depth;
    ++s.lockCount;
    return;
  }
  // A free lock is taken at once: the wait, and the clock read that sets its deadline, are only
  // for a lock that another thread holds.
  const auto ready = [&s] { return s.depth == 0 || s.closed; };
  const bool free =
      ready() || s.lockReleased.wait_for(guard, std::chrono::milliseconds(timeoutMs), ready);
  if (s.closed) {
    throw std::runtime_error("ZinJtag: session " + std::to_string(handle) +
                             " was closed while the call waited for its target lock");
  }
  if (!free) {
    throw std::runtime_error("ZinJtag: target lock of session " + std::to_string(handle) +
                             " not obtained within " + std::to_string(timeoutMs) + " ms");
  }
  s.owner = self;
  s.depth = 1;
  ++s.lockCount;
}

ZinJtagTargetLock::~ZinJtagTargetLock() {
  ZinJtagSessionState& s = *session_;
  std::lock_guard<std::mutex> guard(s.lockMutex);
  if (--s.depth == 0) {
    s.owner = std::thread::id();
    // After a close every waiter must learn of it, not only the next one.
    if (s.closed) {
      s.lockReleased.notify_all();
    } else {
      s.lockReleased.notify_one();
    }
  }
}

bool ZinJtag_session_isLocked(uint32_t handle) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_session_isLocked");
  std::lock_guard<std::mutex> guard(session->lockMutex);
  return session->depth != 0;
}

uint64_t ZinJtag_session_lockCount(uint32_t handle) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_session_lockCount");
  std::lock_guard<std::mutex> guard(session->lockMutex);
  return session->lockCount;
}
