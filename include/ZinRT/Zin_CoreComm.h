// Status reads and command transfers of the framework.
#ifndef ZINRT_ZIN_CORECOMM_H
#define ZINRT_ZIN_CORECOMM_H

#include <cstdint>
#include <string>

#include "ZinRT/ZinCore_Export.h"
#include "ZinRT/ZinCore_Types.h"
#include "ZinRT/Zin_ByteBuffer.h"

typedef enum ZIN_PROGRESS_STATUS {
  ZIN_PROGRESS_RUNNING = 0,
  ZIN_PROGRESS_DONE = 1
} ZIN_PROGRESS_STATUS;
typedef enum ZIN_PROGRESS_RETURN {
  ZIN_PROGRESS_CONTINUE = 0,
  ZIN_PROGRESS_CANCEL = 1
} ZIN_PROGRESS_RETURN;
/// Progress of a transfer: (lines done, lines in all, bits done, status).
typedef ZIN_PROGRESS_RETURN (*ZIN_PROGRESS_CALLBACK)(uint32_t, uint32_t, uint32_t,
                                                     ZIN_PROGRESS_STATUS);

namespace ZinRT {

/// Transfers between the host and the cores of a session, through the session's transport.
class ZINCORE_API Zin_CoreComm {
 public:
  /// Reads the status of a core: `info` is zeroed and filled, `status` is zeroed and receives up
  /// to `bitCount` status bits (at most its size); bits beyond them stay zero. A reference
  /// without a core reads as zeros. Throws std::invalid_argument for a null `info` or an unknown
  /// handle; exceptions of the transport pass through.
  static void getCoreStatus(uint32_t handle, ZIN_CORE_REF ref, ZIN_CORE_INFO* info,
                            Zin_ByteBuffer& status, uint32_t bitCount);
  /// Carries out a command sequence (see Zin_Transport::commandSequence). With `readBitCount`
  /// not 0, `readData` must hold ceil(readBitCount/8) bytes; they are zeroed first. The callback,
  /// if given, is told once when the sequence is done: (lines, lines, readBitCount,
  /// ZIN_PROGRESS_DONE); what it returns is ignored. A null `readData` with `readBitCount` not 0
  /// throws std::invalid_argument.
  static void commandSequence(uint32_t handle, const std::string& text, unsigned char* readData,
                              uint32_t readBitCount, ZIN_PROGRESS_CALLBACK progress);
};

}  // namespace ZinRT

/// Reads the status of a core into `info` (zeroed first) and, when `status` is not null, up to
/// `bitCount` status bits into it. Returns 0 on success and 0x80000000 when the read fails; never
/// throws.
extern "C" ZINCORE_API uint32_t ZinCore_getCoreStatus(uint32_t handle, ZIN_CORE_REF ref,
                                                      ZIN_CORE_INFO* info, unsigned char* status,
                                                      uint32_t bitCount);

#endif
