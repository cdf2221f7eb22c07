// Whole-port writes and reads of a MOX core.
#include <algorithm>
#include <array>
#include <cstring>
#include <stdexcept>
#include <string>
#include <utility>

#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_CoreParts.h"

namespace ZinRT {

namespace {

// Packs a port string into a caller's vector, skipping null destinations.
void packInto(uint8_t* destination, const std::string& bits) {
  if (destination != nullptr) Zin_NumberUtil::reverseBinStr2Bin(bits, destination);
}

// A member caller (not only the exported functions) may pass a count; one that is neither 0 nor
// the port's width would index past the port image.
void checkPortCount(uint32_t count, uint32_t width, const char* function, const char* name) {
  if (count != 0 && count != width) {
    throw std::logic_error(std::string("ZinMOX_Core::") + function + "(): " + name + " " +
                           std::to_string(count) + " is neither 0 nor the port width " +
                           std::to_string(width));
  }
}

}  // namespace

void ZinMOX_Core::setPortBits(uint32_t handle, ZIN_CORE_REF coreRef, const uint8_t* asyncOutData,
                              const uint8_t* asyncOutUpdateMask, uint32_t asyncOutDataBitCount,
                              const uint8_t* syncOutData, const uint8_t* syncOutUpdateMask,
                              uint32_t syncOutDataBitCount) {
  checkPortCount(asyncOutDataBitCount, moxCoreInfo.async_output_count, "setPortBits",
                 "asyncOutDataBitCount");
  checkPortCount(syncOutDataBitCount, moxCoreInfo.sync_output_count, "setPortBits",
                 "syncOutDataBitCount");
  parts->command.clearUpdateMasks();
  // Each port string is converted in place: the image keeps its storage from call to call.
  if (asyncOutDataBitCount != 0) {
    parts->command.setAsyncOutValueBits(asyncOutData, asyncOutDataBitCount);
    parts->command.setAsyncOutUpdateBits(asyncOutUpdateMask, asyncOutDataBitCount);
  }
  if (syncOutDataBitCount != 0) {
    parts->command.setSyncOutUpdateBits(syncOutUpdateMask, syncOutDataBitCount);
    parts->command.setStepVectors(syncOutData, syncOutDataBitCount);
  }
  parts->command.writeOutputs(handle, coreRef);
}

void ZinMOX_Core::getPortBits(uint32_t handle, ZIN_CORE_REF coreRef, uint8_t* asyncInData,
                              uint8_t* asyncInActivityUp, uint8_t* asyncInActivityDown,
                              uint32_t asyncInDataBitCount, uint8_t* syncInData,
                              uint8_t* syncInActivityUp, uint8_t* syncInActivityDown,
                              uint8_t* syncInSyncActivityUp, uint8_t* syncInSyncActivityDown,
                              uint32_t syncInDataBitCount) {
  checkPortCount(asyncInDataBitCount, moxCoreInfo.async_input_count, "getPortBits",
                 "asyncInDataBitCount");
  checkPortCount(syncInDataBitCount, moxCoreInfo.sync_input_count, "getPortBits",
                 "syncInDataBitCount");
  parts->command.readInputs(handle, coreRef);
  if (asyncInDataBitCount != 0) {
    packInto(asyncInData, parts->command.getAsyncInValueBits());
    packInto(asyncInActivityUp, parts->command.getAsyncInActivityUpBits());
    packInto(asyncInActivityDown, parts->command.getAsyncInActivityDownBits());
  }
  if (syncInDataBitCount != 0) {
    packInto(syncInData, parts->command.getSyncInValueBits());
    packInto(syncInActivityUp, parts->command.getSyncInActivityUpBits());
    packInto(syncInActivityDown, parts->command.getSyncInActivityDownBits());
    packInto(syncInSyncActivityUp, parts->command.getSyncInSyncActivityUpBits());
    packInto(syncInSyncActivityDown, parts->command.getSyncInSyncActivityDownBits());
  }
}

}  // namespace ZinRT
