// JTAG sessions of the framework: opening and closing, session messages, the target lock, flush.
#ifndef ZINRT_ZINJTAG_H
#define ZINRT_ZINJTAG_H

#include <cstdint>
#include <functional>
#include <memory>

#include "ZinRT/ZinJtag_Export.h"
#include "ZinRT/Zin_Transport.h"

/// Message codes of `ZinJtag_session_sendMessage`.
#define ZINJTAG_MSG_ERROR 0x100u
#define ZINJTAG_MSG_ABORT 0x8000u

/// Receives the messages of one session: (user pointer, session handle, code, text).
typedef void (*ZinJtag_MessageHandler)(void* user, uint32_t handle, uint32_t code,
                                       const char* text);

/// Opens a session on `transport` and returns its handle (never 0). The session owns the
/// transport until it is closed. Throws std::invalid_argument for a null transport.
ZINJTAG_API uint32_t ZinJtag_openSession(std::shared_ptr<ZinRT::Zin_Transport> transport);

/// Closes a session: the close hooks run (the cores registered on it are destroyed), the handle
/// becomes unknown, then the transport is released (once no target lock holds the session any
/// more). Throws std::invalid_argument for an unknown handle or a session that another thread is
/// closing. A hook that throws does not keep the session open: the other hooks still run, the
/// session is closed, then the first exception is passed on. The close takes the session's target
/// lock first, so it waits for a call in progress on another thread; calls that wait for the lock
/// then fail with "ZinJtag: session N was closed while the call waited for its target lock", and
/// later calls find no session with the handle. Must not be called from inside a call on the same
/// session (from its message handler, say).
ZINJTAG_API void ZinJtag_closeSession(uint32_t handle);

/// Registers the message handler of a session (null restores the default, which writes
/// "ZinJtag[handle] code 0xNNNN: text" lines to standard error).
ZINJTAG_API void ZinJtag_setMessageHandler(uint32_t handle, ZinJtag_MessageHandler handler,
                                           void* user);

/// Delivers one message to the session's host. Throws std::invalid_argument for an unknown
/// handle. The messages of one session reach its handler one at a time and in the order they
/// were sent; a handler may itself send messages. A null text is delivered as the empty text.
ZINJTAG_API void ZinJtag_session_sendMessage(uint32_t handle, uint32_t code, const char* text);

/// Flushes the session's transport.
ZINJTAG_API void ZinJtag_target_flush(uint32_t handle);

/// Runs `work` with the session's transport while holding the session's transport mutex, so
/// that no two transfers of one session overlap. Throws std::invalid_argument for an unknown
/// handle; exceptions of `work` pass through.
ZINJTAG_API void ZinJtag_session_withTransport(
    uint32_t handle, const std::function<void(ZinRT::Zin_Transport&)>& work);

/// Registers a function that is called with the handle of every session being closed, before its
/// transport is released. Used by the core list to drop the cores of a closed session. A hook
/// registered twice is called once; a null hook throws std::invalid_argument.
ZINJTAG_API void ZinJtag_addSessionCloseHook(void (*hook)(uint32_t handle));

/// For tests: whether any thread holds the session's target lock, and how many times the lock has
/// been taken (re-entrant acquisitions included) since the session was opened.
ZINJTAG_API bool ZinJtag_session_isLocked(uint32_t handle);
ZINJTAG_API uint64_t ZinJtag_session_lockCount(uint32_t handle);

/// The target lock of a session, held from construction to destruction. Re-entrant for the
/// thread that holds it. When the lock cannot be had within `timeoutMs` milliseconds the
/// constructor throws std::runtime_error naming the session and the timeout; an unknown handle
/// throws std::invalid_argument.
class ZINJTAG_API ZinJtagTargetLock {
 public:
  ZinJtagTargetLock(uint32_t handle, uint32_t timeoutMs);
  ~ZinJtagTargetLock();
  ZinJtagTargetLock(const ZinJtagTargetLock&) = delete;
  ZinJtagTargetLock& operator=(const ZinJtagTargetLock&) = delete;

 private:
  std::shared_ptr<struct ZinJtagSessionState> session_;  // keeps the session alive while held
};

#endif
