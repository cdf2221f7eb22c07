// Base of every core object.
#include "ZinRT/Zin_Core.h"

namespace ZinRT {

Zin_Core::Zin_Core(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo)
    : handle_(handle), coreRef_(coreRef), coreInfo_(coreInfo) {}

Zin_Core::~Zin_Core() = default;

bool Zin_Core::initFromStatusWord(uint32_t) {
  return true;
}

bool Zin_Core::isZinQbusSlave() {
  return false;
}

}  // namespace ZinRT
