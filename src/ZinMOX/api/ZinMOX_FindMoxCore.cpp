// Lookup of the registered MOX core of a reference.
#include <string>

#include "api/ZinMOX_CallFrame.h"

namespace ZinRT::mox {

ZinMOX_Core& findMoxCore(uint32_t handle, const ZIN_CORE_REF* coreRef, const char* function) {
  const ZIN_CORE_REF ref = copyCoreRef(coreRef, function);
  Zin_Core* core = Zin_CoreList::getCore(handle, ref);
  // A type-9 core of another class (only another library could register one) is treated as
  // not initialised rather than handed out as something it is not.
  if (core != nullptr && core->getCoreType() == CORE_TYPE_MOX) {
    if (auto* moxCore = dynamic_cast<ZinMOX_Core*>(core)) return *moxCore;
  }
  throw std::logic_error(
      "Data structures not initialized for MOX core Device:" + std::to_string(ref.deviceIndex) +
      ", user chain number:" + std::to_string(ref.userChainNumber) +
      ", core index:" + std::to_string(ref.coreIndex) + ".");
}

}  // namespace ZinRT::mox
