// A JTAG session opened by zinmox: its handle, the messages of each call, and closing.
#ifndef ZINMOX_PYTHON_SESSION_H
#define ZINMOX_PYTHON_SESSION_H

#include <pybind11/pybind11.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <shared_mutex>
#include <string>

#include "Errors.h"
#include "Transport.h"

namespace zinmox {

/// Owns one session. Library calls run with the GIL released and under a shared lock, so that
/// other Python threads keep running and close() waits until no call is inside the session.
///
/// Messages: the session's handler files each message under the call that the sending thread is
/// making on this session (the library sends a call's messages from the calling thread), so a
/// failing call raises zinmox.Error with exactly its own messages. Messages that arrive outside
/// any call, and those of calls that succeed, go to the logger "zinmox". The handler never
/// touches Python objects.
class SessionState : public std::enable_shared_from_this<SessionState> {
 public:
  explicit SessionState(TransportChoice transport);
  ~SessionState();
  SessionState(const SessionState&) = delete;
  SessionState& operator=(const SessionState&) = delete;

  /// 0 once the session is closed.
  uint32_t handle() const { return handle_.load(); }
  bool closed() const { return handle() == 0; }
  const std::shared_ptr<ZinSim::Target>& simulated() const { return transport_.simulated; }
  const std::string& description() const { return transport_.description; }

  /// Closes the session (the cores registered on it are dropped). Closing twice does nothing.
  void close();

  /// Runs `work` (one exported call, given the handle) with the GIL released; raises Failure
  /// with the call's messages when it returns anything but 0, and logs them otherwise.
  void call(const std::string& function, const std::function<uint32_t(uint32_t)>& work);

  /// Runs `work` with the GIL released and the session held open; returns the messages it
  /// produced, for the caller to raise or log.
  Messages run(const std::function<void(uint32_t)>& work);

 private:
  static void onMessage(void* user, uint32_t handle, uint32_t code, const char* text);
  void logPending();

  TransportChoice transport_;
  std::atomic<uint32_t> handle_{0};
  std::shared_mutex closeMutex_;  // shared by calls, exclusive for close
  std::mutex pendingMutex_;
  Messages pending_;  // messages that arrived outside any call of this module
};

void bindSession(pybind11::module_& module);

}  // namespace zinmox

#endif
