/* libZinMOX: the exported functions. Usable from C and C++.

   Every function takes the JTAG session handle first and a pointer to the core's reference
   second, and returns 0 on success or 0x80000000 on failure (ZinMOX_isMOXCore returns the status
   of its status read). Failures are reported as text messages on the session: code 256 for an
   error, 32768 for the abort message "Zin abort command". No exception leaves a function.

   Signal-type codes of the define and undefine calls: */
#ifndef ZINMOX_H
#define ZINMOX_H

#include <stdint.h>

#include "ZinMOX/ZinMOX_CoreInfo.h"
#include "ZinMOX/ZinMOX_Export.h"
#include "ZinRT/ZinCore_Types.h"

#define ZINMOX_SYNC_OUTPUT 0u  /* synchronous output port */
#define ZINMOX_SYNC_INPUT 1u   /* synchronous input port */
#define ZINMOX_ASYNC_OUTPUT 2u /* asynchronous output port */
#define ZINMOX_ASYNC_INPUT 3u  /* asynchronous input port */

#define ZINMOX_SUCCESS 0u
#define ZINMOX_FAILURE 0x80000000u

#ifdef __cplusplus
#include "ZinMOX/ZinMOX_ValueMap.h"
extern "C" {
#endif

/* Reads the core's status and fills *coreInfo (zeroed first). Fails for a core that is not a
   MOX core. */
ZINMOX_API uint32_t ZinMOX_getInfo(uint32_t handle, ZIN_CORE_REF* coreRef,
                                   ZINMOX_CORE_INFO* coreInfo);

/* Sets *result to 1 if the referenced core is a MOX core, else 0; returns the status of the
   status read. */
ZINMOX_API uint32_t ZinMOX_isMOXCore(uint32_t handle, ZIN_CORE_REF* coreRef, uint32_t* result);

/* Reads the core's status, creates the core object, defines the reserved whole-port signals
   "async_out_data", "sync_out_data", "async_in_data", "sync_in_data" and registers the object.
   A core registered at the reference before is removed first (its names are gone). */
ZINMOX_API uint32_t ZinMOX_initCore(uint32_t handle, ZIN_CORE_REF* coreRef);

/* Removes the registered MOX core at the reference, if any. */
ZINMOX_API uint32_t ZinMOX_terminateCore(uint32_t handle, ZIN_CORE_REF* coreRef);

/* Writes the twelve fields of the core's information record as decimal texts into the value map
   whose address *coreInfo holds, under the keys "manufacturer_id", "core_type",
   "core_major_version", "core_minor_version", "core_revision", "qx_major_version",
   "qx_minor_version", "qx_minor_version_alpha", "async_input_count", "sync_input_count",
   "async_output_count", "sync_output_count". Other keys of the map are kept. */
ZINMOX_API uint32_t ZinMOX_getCoreInfo(uint32_t handle, ZIN_CORE_REF* coreRef, uintptr_t* coreInfo);

/* Names one port bit. signalType: ZINMOX_SYNC_OUTPUT, ZINMOX_SYNC_INPUT, ZINMOX_ASYNC_OUTPUT or
   ZINMOX_ASYNC_INPUT. Names are unique per direction and case-insensitive. */
ZINMOX_API uint32_t ZinMOX_defineSignal(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                                        uint32_t signalType, uint32_t bitIndex);

/* Names an ordered list of port bits: value bit i is port bit bitIndexArray[i]. */
ZINMOX_API uint32_t ZinMOX_defineBus(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                                     uint32_t signalType, const uint32_t* bitIndexArray,
                                     uint32_t arrayLen);

/* Removes a name: input types search the inputs, every other value the outputs. */
ZINMOX_API uint32_t ZinMOX_undefineName(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                                        uint32_t signalType);

/* Writes the widths in bits of arrayLen named outputs (isOutput non-zero) or inputs. */
ZINMOX_API uint32_t ZinMOX_getSignalSizes(uint32_t handle, ZIN_CORE_REF* coreRef,
                                          const char** nameArray, uint32_t* sizeArray,
                                          uint32_t arrayLen, uint32_t isOutput);

/* Writes whole output ports. Packed vectors hold port bit i in bit (i mod 8) of byte i/8. Each
   count is the port's width or 0 (that port is left out of the write). syncOutData holds 16
   vectors, step t at byte t*ceil(syncOutDataBitCount/8). */
ZINMOX_API uint32_t ZinMOX_setPortBits(uint32_t handle, ZIN_CORE_REF* coreRef,
                                       const uint8_t* asyncOutData,
                                       const uint8_t* asyncOutUpdateMask,
                                       uint32_t asyncOutDataBitCount, const uint8_t* syncOutData,
                                       const uint8_t* syncOutUpdateMask,
                                       uint32_t syncOutDataBitCount);

/* Reads whole input ports with their activity into packed vectors; null pointers are skipped and
   a count of 0 (else the port's width) fills none of that port's vectors. */
ZINMOX_API uint32_t ZinMOX_getPortBits(uint32_t handle, ZIN_CORE_REF* coreRef, uint8_t* asyncInData,
                                       uint8_t* asyncInActivityUp, uint8_t* asyncInActivityDown,
                                       uint32_t asyncInDataBitCount, uint8_t* syncInData,
                                       uint8_t* syncInActivityUp, uint8_t* syncInActivityDown,
                                       uint8_t* syncInSyncActivityUp,
                                       uint8_t* syncInSyncActivityDown,
                                       uint32_t syncInDataBitCount);

/* Writes named outputs from the value map whose address *outputHashMap holds, in one transfer.
   Values are hexadecimal texts, most significant digit first; the key suffix ".pulsetrain" gives
   a synchronous output 16 step values, step 0 in the least significant block. */
ZINMOX_API uint32_t ZinMOX_writeValues(uint32_t handle, ZIN_CORE_REF* coreRef,
                                       uintptr_t* outputHashMap);

/* Reads every input signal in one transfer into the value map whose address *inputHashMap holds:
   keys name, name.value, name.activity_up, name.activity_down and, for synchronous inputs,
   name.sync_activity_up and name.sync_activity_down. */
ZINMOX_API uint32_t ZinMOX_readValues(uint32_t handle, ZIN_CORE_REF* coreRef,
                                      uintptr_t* inputHashMap);

#ifdef __cplusplus
}
#endif

#endif
