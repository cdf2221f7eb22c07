// Base of every core object of the framework.
#ifndef ZINRT_ZIN_CORE_H
#define ZINRT_ZIN_CORE_H

#include <cstdint>

#include "ZinRT/ZinCore_Export.h"
#include "ZinRT/ZinCore_Types.h"

namespace ZinRT {

/// A core of one session at one reference, with the information it reported.
class ZINCORE_API Zin_Core {
 public:
  Zin_Core(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo);
  virtual ~Zin_Core();

  /// Initialises the object from the core's status; the base has nothing to do and returns true.
  virtual bool initFromStatusWord(uint32_t handle);
  /// Whether the core is a bus slave of the framework's own bus; false for the base.
  virtual bool isZinQbusSlave();

  uint32_t getCoreType() const { return coreInfo_.coreType; }
  const ZIN_CORE_INFO& getCoreInfo() const { return coreInfo_; }
  const ZIN_CORE_REF& getCoreRef() const { return coreRef_; }
  uint32_t getHandle() const { return handle_; }

 protected:
  Zin_Core(const Zin_Core&) = default;
  Zin_Core& operator=(const Zin_Core&) = default;

 private:
  uint32_t handle_;
  ZIN_CORE_REF coreRef_;
  ZIN_CORE_INFO coreInfo_;
};

}  // namespace ZinRT

#endif
