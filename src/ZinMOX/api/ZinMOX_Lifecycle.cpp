// ZinMOX_initCore, ZinMOX_terminateCore and ZinMOX_getCoreInfo: the life of a core object.
#include <memory>
#include <string>

#include "ZinMOX/ZinMOX.h"
#include "internal/ZinMOX_CoreInfoFields.h"
#include "api/ZinMOX_CallFrame.h"

using namespace ZinRT;
using namespace ZinRT::mox;

namespace {

// Removes whatever core is registered at the reference before a new one is created.
void removeRegisteredCore(uint32_t handle, ZIN_CORE_REF* coreRef, const ZIN_CORE_REF& ref) {
  Zin_Core* existing = Zin_CoreList::getCore(handle, ref);
  if (existing == nullptr) return;
  if (existing->getCoreType() == CORE_TYPE_MOX) {
    ZinMOX_terminateCore(handle, coreRef);  // reports its own failures
  } else {
    Zin_CoreList::removeCore(handle, &existing);
  }
}

// Reads the status of a core that must be a MOX core; else sends the function's wrong-type
// message and aborts.
ZIN_CORE_INFO readMoxStatus(uint32_t handle, const ZIN_CORE_REF& ref, Zin_ByteBuffer& status,
                            const char* wrongTypeMessage) {
  ZIN_CORE_INFO info{};
  Zin_CoreComm::getCoreStatus(handle, ref, &info, status, status.getSize() * 8);
  if (info.coreType != CORE_TYPE_MOX) {
    sendMessage(handle, MESSAGE_ERROR, wrongTypeMessage);
    throw Zin_AbortException();
  }
  return info;
}

}  // namespace

uint32_t ZinMOX_initCore(uint32_t handle, ZIN_CORE_REF* coreRef) {
  return runFrame(handle, [&]() -> uint32_t {
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    const ZIN_CORE_REF ref = copyCoreRef(coreRef, "ZinMOX_initCore");
    Zin_ByteBuffer status(STATUS_BUFFER_SIZE, STATUS_BUFFER_RESERVE, STATUS_BUFFER_GROW);
    removeRegisteredCore(handle, coreRef, ref);
    const ZIN_CORE_INFO info = readMoxStatus(
        handle, ref, status, "ZinMOX_initCore() for the wrong core type or non-existant core.");
    // Owned here until the core list takes it, so a failing initialisation does not leak it.
    auto core =
        std::make_unique<ZinMOX_Core>(handle, ref, info, status.uPtr(), status.getSize() * 8);
    core->initFromStatusWord(handle);
    Zin_CoreList::addCore(handle, core.get());
    core.release();
    return CALL_SUCCESS;
  });
}

uint32_t ZinMOX_terminateCore(uint32_t handle, ZIN_CORE_REF* coreRef) {
  return runFrame(handle, [&]() -> uint32_t {
    // The lock keeps a terminate from destroying a core that another thread's call is using.
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    const ZIN_CORE_REF ref = copyCoreRef(coreRef, "ZinMOX_terminateCore");
    Zin_Core* core = Zin_CoreList::getCore(handle, ref);
    if (core != nullptr && core->getCoreType() == CORE_TYPE_MOX) {
      Zin_CoreList::removeCore(handle, &core);
    }
    return CALL_SUCCESS;
  });
}

uint32_t ZinMOX_getCoreInfo(uint32_t handle, ZIN_CORE_REF* coreRef, uintptr_t* coreInfo) {
  return runFrame(handle, [&]() -> uint32_t {
    if (coreInfo == nullptr) {
      throw std::logic_error("Arg. to function ZinMOX_getCoreInfo() failed:coreInfo!=0");
    }
    if (*coreInfo == 0) {
      throw std::logic_error("Arg. to function ZinMOX_getCoreInfo() failed:*coreInfo!=0");
    }
    const ZIN_CORE_REF ref = copyCoreRef(coreRef, "ZinMOX_getCoreInfo");
    ZinJtagTargetLock lock(handle, TARGET_LOCK_TIMEOUT);
    ZINMOX_CORE_INFO record{};
    Zin_ByteBuffer status(STATUS_BUFFER_SIZE, STATUS_BUFFER_RESERVE, STATUS_BUFFER_GROW);
    const ZIN_CORE_INFO info = readMoxStatus(
        handle, ref, status, "ZinMOX_getCoreInfo() for the wrong core type or non-existant core.");
    ZinMOX_Core::getMoxCoreStatus(handle, ref, info, status, status.getSize() * 8, &record);

    auto& map = *reinterpret_cast<ZinMOX_ValueMap*>(*coreInfo);
    std::string text;
    for (const ZinMOX_CoreInfoField& entry : ZINMOX_CORE_INFO_FIELDS) {
      map[entry.key] = Zin_NumberUtil::uInt2DecStr(record.*entry.member, text);
    }
    return CALL_SUCCESS;
  });
}
