// The exported named-value calls: the map's address is read from the word the caller points to.
#include "ZinMOX/ZinMOX.h"
#include "api/ZinMOX_CallFrame.h"

using namespace ZinRT;
using namespace ZinRT::mox;

uint32_t ZinMOX_writeValues(uint32_t handle, ZIN_CORE_REF* coreRef, uintptr_t* outputHashMap) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_writeValues", [&](ZinMOX_Core& core) {
    checkArgument(outputHashMap != nullptr, "ZinMOX_writeValues", "outputHashMap!=0");
    checkArgument(*outputHashMap != 0, "ZinMOX_writeValues", "*outputHashMap!=0");
    core.writeValues(handle, *coreRef, reinterpret_cast<const ZinMOX_ValueMap*>(*outputHashMap));
  });
}

uint32_t ZinMOX_readValues(uint32_t handle, ZIN_CORE_REF* coreRef, uintptr_t* inputHashMap) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_readValues", [&](ZinMOX_Core& core) {
    checkArgument(inputHashMap != nullptr, "ZinMOX_readValues", "inputHashMap!=0");
    checkArgument(*inputHashMap != 0, "ZinMOX_readValues", "*inputHashMap!=0");
    core.readValues(handle, *coreRef, reinterpret_cast<ZinMOX_ValueMap*>(*inputHashMap));
  });
}
