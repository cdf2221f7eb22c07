// A single framework signal with the default properties of a MOX core's signals.
#ifndef ZINMOX_SIGNAL_H
#define ZINMOX_SIGNAL_H

#include <string>

#include "ZinMOX/ZinMOX_Export.h"
#include "ZinRT/Zin_Signal.h"

namespace ZinRT {

/// A framework signal whose properties "format" (the name followed by ":%b %a'"), "reset_value"
/// ("0"), "low_value" ("0") and "high_value" ("1") are set on construction.
class ZINMOX_API ZinMOX_Signal final : public Zin_Signal {
 public:
  /// The three numbers (type, position, reset level) and the name go to the framework signal.
  ZinMOX_Signal(uint32_t type, uint32_t position, uint32_t resetLevel, const std::string& name);
  ZinMOX_Signal(const ZinMOX_Signal& other);
  ZinMOX_Signal& operator=(const ZinMOX_Signal& other);
  ~ZinMOX_Signal();

 private:
  void setDefaultParameters();
};

}  // namespace ZinRT

#endif
