// The exported whole-port calls: counts checked against the core's physical port widths.
#include "ZinMOX/ZinMOX.h"
#include "api/ZinMOX_CallFrame.h"

using namespace ZinRT;
using namespace ZinRT::mox;

namespace {

// A bit count must be the core's physical count for its signal type, or 0.
void checkPortCount(const ZinMOX_Core& core, uint32_t count, uint32_t type, const char* function,
                    const char* condition) {
  const uint32_t physical = core.getCorePhysicalSignalCount(type);
  checkArgument(count == physical || count == 0, function, condition);
}

}  // namespace

uint32_t ZinMOX_setPortBits(uint32_t handle, ZIN_CORE_REF* coreRef, const uint8_t* asyncOutData,
                            const uint8_t* asyncOutUpdateMask, uint32_t asyncOutDataBitCount,
                            const uint8_t* syncOutData, const uint8_t* syncOutUpdateMask,
                            uint32_t syncOutDataBitCount) {
  constexpr const char* fn = "ZinMOX_setPortBits";
  return runOnMoxCore(handle, coreRef, fn, [&](ZinMOX_Core& core) {
    checkPortCount(core, asyncOutDataBitCount, Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, fn,
                   "(asyncOutDataBitCount == core->getCorePhysicalSignalCount(Zin_SignalBase::"
                   "SIGNAL_TYPE_MOX_ASYNC_OUTPUT)) || (asyncOutDataBitCount == 0)");
    checkPortCount(core, syncOutDataBitCount, Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT, fn,
                   "(syncOutDataBitCount == core->getCorePhysicalSignalCount(Zin_SignalBase::"
                   "SIGNAL_TYPE_MOX_SYNC_OUTPUT)) || (syncOutDataBitCount == 0)");
    // The vectors of a port that takes part in the write are read: they must exist.
    const bool async = asyncOutDataBitCount != 0;
    const bool sync = syncOutDataBitCount != 0;
    checkArgument(!async || asyncOutData != nullptr, fn, "asyncOutData!=0");
    checkArgument(!async || asyncOutUpdateMask != nullptr, fn, "asyncOutUpdateMask!=0");
    checkArgument(!sync || syncOutData != nullptr, fn, "syncOutData!=0");
    checkArgument(!sync || syncOutUpdateMask != nullptr, fn, "syncOutUpdateMask!=0");
    core.setPortBits(handle, *coreRef, asyncOutData, asyncOutUpdateMask, asyncOutDataBitCount,
                     syncOutData, syncOutUpdateMask, syncOutDataBitCount);
  });
}

uint32_t ZinMOX_getPortBits(uint32_t handle, ZIN_CORE_REF* coreRef, uint8_t* asyncInData,
                            uint8_t* asyncInActivityUp, uint8_t* asyncInActivityDown,
                            uint32_t asyncInDataBitCount, uint8_t* syncInData,
                            uint8_t* syncInActivityUp, uint8_t* syncInActivityDown,
                            uint8_t* syncInSyncActivityUp, uint8_t* syncInSyncActivityDown,
                            uint32_t syncInDataBitCount) {
  constexpr const char* fn = "ZinMOX_getPortBits";
  return runOnMoxCore(handle, coreRef, fn, [&](ZinMOX_Core& core) {
    checkPortCount(core, asyncInDataBitCount, Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT, fn,
                   "(asyncInDataBitCount == core->getCorePhysicalSignalCount(Zin_SignalBase::"
                   "SIGNAL_TYPE_MOX_ASYNC_INPUT)) || (asyncInDataBitCount == 0)");
    checkPortCount(core, syncInDataBitCount, Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT, fn,
                   "(syncInDataBitCount == core->getCorePhysicalSignalCount(Zin_SignalBase::"
                   "SIGNAL_TYPE_MOX_SYNC_INPUT)) || (syncInDataBitCount == 0)");
    core.getPortBits(handle, *coreRef, asyncInData, asyncInActivityUp, asyncInActivityDown,
                     asyncInDataBitCount, syncInData, syncInActivityUp, syncInActivityDown,
                     syncInSyncActivityUp, syncInSyncActivityDown, syncInDataBitCount);
  });
}
