// The exported calls that manage the named signals and buses of a registered core.
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "api/ZinMOX_CallFrame.h"

using namespace ZinRT;
using namespace ZinRT::mox;

uint32_t ZinMOX_defineSignal(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                             uint32_t signalType, uint32_t bitIndex) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_defineSignal", [&](ZinMOX_Core& core) {
    checkArgument(name != nullptr, "ZinMOX_defineSignal", "name!=0");
    std::vector<uint32_t> positions{bitIndex};
    core.defineSignal(name, signalType, positions);
  });
}

uint32_t ZinMOX_defineBus(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                          uint32_t signalType, const uint32_t* bitIndexArray, uint32_t arrayLen) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_defineBus", [&](ZinMOX_Core& core) {
    checkArgument(name != nullptr, "ZinMOX_defineBus", "name!=0");
    checkArgument(bitIndexArray != nullptr, "ZinMOX_defineBus", "bitIndexArray!=0");
    checkArgument(arrayLen != 0, "ZinMOX_defineBus", "arrayLen!=0");
    std::vector<uint32_t> positions(bitIndexArray, bitIndexArray + arrayLen);
    core.defineSignal(name, signalType, positions);
  });
}

uint32_t ZinMOX_undefineName(uint32_t handle, ZIN_CORE_REF* coreRef, const char* name,
                             uint32_t signalType) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_undefineName", [&](ZinMOX_Core& core) {
    checkArgument(name != nullptr, "ZinMOX_undefineName", "name!=0");
    core.undefineSignal(name, signalType);
  });
}

uint32_t ZinMOX_getSignalSizes(uint32_t handle, ZIN_CORE_REF* coreRef, const char** nameArray,
                               uint32_t* sizeArray, uint32_t arrayLen, uint32_t isOutput) {
  return runOnMoxCore(handle, coreRef, "ZinMOX_getSignalSizes", [&](ZinMOX_Core& core) {
    checkArgument(nameArray != nullptr, "ZinMOX_getSignalSizes", "nameArray!=0");
    checkArgument(sizeArray != nullptr, "ZinMOX_getSignalSizes", "sizeArray!=0");
    checkArgument(arrayLen != 0, "ZinMOX_getSignalSizes", "arrayLen!=0");
    std::vector<std::string> names;
    names.reserve(arrayLen);
    for (uint32_t i = 0; i < arrayLen; ++i) {
      checkArgument(nameArray[i] != nullptr, "ZinMOX_getSignalSizes", "nameArray[i]!=0");
      names.emplace_back(nameArray[i]);
    }
    core.getSignalSizes(names, sizeArray, arrayLen, isOutput);
  });
}
