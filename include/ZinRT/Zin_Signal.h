// A single signal of the framework.
#ifndef ZINRT_ZIN_SIGNAL_H
#define ZINRT_ZIN_SIGNAL_H

#include "ZinRT/Zin_SignalBase.h"

namespace ZinRT {

// Signals are always destroyed through their own class, so the destructor is deliberately not
// virtual; the warning about it is silenced for this class only.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"
/// One port bit of a core: its type, its position on the port and its reset level.
class ZINCORE_API Zin_Signal : public Zin_SignalBase {
 public:
  Zin_Signal(uint32_t type, uint32_t position, uint32_t resetLevel, const std::string& name);
  Zin_Signal(const Zin_Signal&);
  Zin_Signal& operator=(const Zin_Signal&);
  ~Zin_Signal();

  uint32_t getPosition() const { return position_; }
  uint32_t getResetLevel() const { return resetLevel_; }

 private:
  uint32_t position_;
  uint32_t resetLevel_;
};
#pragma GCC diagnostic pop

}  // namespace ZinRT

#endif
