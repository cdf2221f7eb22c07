// The frame that every exported function runs in: failures become session messages and the
// return code 0x80000000; no exception leaves an exported function.
#ifndef ZINMOX_CALLFRAME_H
#define ZINMOX_CALLFRAME_H

#include <exception>
#include <stdexcept>
#include <string>

#include "ZinMOX/ZinMOX_Core.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT::mox {

/// Reports one caught exception on the session: code 32768 when its text is exactly
/// "Zin abort command", else 256. Returns 0x80000000.
uint32_t sendExceptionMessage(uint32_t handle, const std::exception& error);
/// Reports an exception of no standard type as "Zin internal error.". Returns 0x80000000.
uint32_t sendInternalError(uint32_t handle);
/// Sends one message; a session that cannot take it (an unknown handle) is ignored, since there
/// is nowhere left to report to.
void sendMessage(uint32_t handle, uint32_t code, const char* text);

/// Runs `work` (returning the call's result) and turns every exception that leaves it into the
/// session messages and return code of a failed call. Scoped objects inside `work`, the target
/// lock above all, are released before the messages are sent.
template <class Work>
uint32_t runFrame(uint32_t handle, Work&& work) noexcept {
  try {
    return work();
  } catch (const std::exception& error) {
    return sendExceptionMessage(handle, error);
  } catch (...) {
    return sendInternalError(handle);
  }
}

/// Fails with "<function>() arg. failed:<condition>" unless `ok`.
inline void checkArgument(bool ok, const char* function, const char* condition) {
  if (!ok) throw std::logic_error(std::string(function) + "() arg. failed:" + condition);
}

/// A copy of the caller's core reference; a null pointer fails like an argument check.
inline ZIN_CORE_REF copyCoreRef(const ZIN_CORE_REF* coreRef, const char* function) {
  checkArgument(coreRef != nullptr, function, "coreRef!=0");
  return *coreRef;
}

/// The MOX core registered at the reference; fails with the not-initialised message otherwise.
ZinMOX_Core& findMoxCore(uint32_t handle, const ZIN_CORE_REF* coreRef, const char* function);

/// The frame of the calls that work on a registered core: lock, lookup, then `work(core)`.
template <class Work>
uint32_t runOnMoxCore(uint32_t handle, const ZIN_CORE_REF* coreRef, const char* function,
                      Work&& work) noexcept {
  return runFrame(handle, [&]() -> uint32_t {
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    ZinMOX_Core& core = findMoxCore(handle, coreRef, function);
    work(core);
    return CALL_SUCCESS;
  });
}

}  // namespace ZinRT::mox

#endif
