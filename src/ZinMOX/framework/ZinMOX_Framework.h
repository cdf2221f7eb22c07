// The declarations through which the library calls its framework: cores, signals and the core
// list and transfers (libZinCore), sessions, messages, the target lock and flush (libZinJtag),
// byte buffers and conversions (libZinUtil).
#ifndef ZINMOX_FRAMEWORK_H
#define ZINMOX_FRAMEWORK_H

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_AbortException.h"
#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_Core.h"
#include "ZinRT/Zin_CoreComm.h"
#include "ZinRT/Zin_CoreList.h"
#include "ZinRT/Zin_NumberUtil.h"
#include "ZinRT/Zin_SignalBase.h"
#include "ZinRT/Zin_SignalCore.h"

namespace ZinRT::mox {

/// Core type that identifies a MOX core.
inline constexpr uint32_t CORE_TYPE_MOX = 9;
/// Second argument of every target lock the exported functions take.
inline constexpr uint32_t TARGET_LOCK_TIMEOUT = 60000;
/// Message codes.
inline constexpr uint32_t MESSAGE_ERROR = 256;
inline constexpr uint32_t MESSAGE_ABORT = 32768;
/// Return codes of the exported functions.
inline constexpr uint32_t CALL_SUCCESS = 0;
inline constexpr uint32_t CALL_FAILURE = 0x80000000u;
/// Arguments of the status buffer of a status read.
inline constexpr uint32_t STATUS_BUFFER_SIZE = 154;
inline constexpr uint32_t STATUS_BUFFER_RESERVE = 10;
inline constexpr uint32_t STATUS_BUFFER_GROW = 10;

/// A signal type with the group flag removed.
inline uint32_t plainSignalType(uint32_t type) {
  return type & ~Zin_SignalBase::SIGNAL_TYPE_GROUP;
}

/// Number of bytes of a packed vector of `bits` bits.
inline uint32_t byteCount(uint32_t bits) {
  return bits / 8 + (bits % 8 != 0 ? 1 : 0);
}

}  // namespace ZinRT::mox

#endif
