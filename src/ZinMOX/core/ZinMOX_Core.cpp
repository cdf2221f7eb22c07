// ZinMOX_Core: construction, initialisation from the status word, and destruction.
#include "internal/ZinMOX_CoreParts.h"

#include "ZinMOX/ZinMOX_SignalGroup.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT {

ZinMOX_Core::ZinMOX_Core(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo,
                         const unsigned char* status, uint32_t statusBitCount)
    : Zin_SignalCore(handle, coreRef, coreInfo, status, statusBitCount),
      moxCoreInfo{},
      parts(std::make_unique<Parts>()) {}

ZinMOX_Core::~ZinMOX_Core() {
  for (auto& entry : parts->inputSignals) delete entry.second;
  parts->inputSignals.clear();
  for (auto& entry : parts->outputSignals) delete entry.second;
  parts->outputSignals.clear();
}

bool ZinMOX_Core::initFromStatusWord(uint32_t handle) {
  Zin_ByteBuffer& status = getStatusBuffer();
  const uint32_t bitCount = status.getSize() * 8;
  getMoxCoreStatus(handle, getCoreRef(), getCoreInfo(), status, bitCount, &moxCoreInfo);
  setCorePhysicalSignalCounts();
  parts->command.initFromCoreInfo(moxCoreInfo);
  addReservedSignals();
  return true;
}

void ZinMOX_Core::setCorePhysicalSignalCounts() {
  setCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT,
                             moxCoreInfo.async_input_count);
  setCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT,
                             moxCoreInfo.sync_input_count);
  setCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT,
                             moxCoreInfo.async_output_count);
  setCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT,
                             moxCoreInfo.sync_output_count);
}

void ZinMOX_Core::addSignal(Zin_SignalBase* /*signal*/) {}

Zin_SignalBase* ZinMOX_Core::getSignal(const std::string& /*name*/, uint32_t /*type*/,
                                       uint32_t /*position*/) {
  return nullptr;
}

void ZinMOX_Core::removeSignal(Zin_SignalBase* /*signal*/) {}

}  // namespace ZinRT
