// ZinMOX_getInfo and ZinMOX_isMOXCore: a core's status read without a core object.
#include <cstring>

#include "ZinMOX/ZinMOX.h"
#include "api/ZinMOX_CallFrame.h"

using namespace ZinRT;
using namespace ZinRT::mox;

uint32_t ZinMOX_getInfo(uint32_t handle, ZIN_CORE_REF* coreRef, ZINMOX_CORE_INFO* coreInfo) {
  return runFrame(handle, [&]() -> uint32_t {
    if (coreInfo == nullptr) {
      throw std::logic_error("Arg. to function ZinMOX_getCoreInfo() failed:coreInfo!=0");
    }
    const ZIN_CORE_REF ref = copyCoreRef(coreRef, "ZinMOX_getInfo");
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    ZIN_CORE_INFO info{};
    std::memset(coreInfo, 0, sizeof(ZINMOX_CORE_INFO));
    Zin_ByteBuffer status(STATUS_BUFFER_SIZE, STATUS_BUFFER_RESERVE, STATUS_BUFFER_GROW);
    Zin_CoreComm::getCoreStatus(handle, ref, &info, status, status.getSize() * 8);
    if (info.coreType != CORE_TYPE_MOX) {
      sendMessage(handle, MESSAGE_ERROR,
                  "ZinMOX_getCoreInfo() for the wrong core type or non-existant core.");
      throw Zin_AbortException();
    }
    ZinMOX_Core::getMoxCoreStatus(handle, ref, info, status, status.getSize() * 8, coreInfo);
    return CALL_SUCCESS;
  });
}

uint32_t ZinMOX_isMOXCore(uint32_t handle, ZIN_CORE_REF* coreRef, uint32_t* result) {
  return runFrame(handle, [&]() -> uint32_t {
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    checkArgument(result != nullptr, "ZinMOX_isMOXCore", "result!=0");
    *result = 0;
    const ZIN_CORE_REF ref = copyCoreRef(coreRef, "ZinMOX_isMOXCore");
    ZIN_CORE_INFO info{};
    const uint32_t status = ZinCore_getCoreStatus(handle, ref, &info, nullptr, 0);
    *result = info.coreType == CORE_TYPE_MOX ? 1 : 0;
    return status;
  });
}
