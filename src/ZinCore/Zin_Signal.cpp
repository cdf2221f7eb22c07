// A single port bit: position and reset level on top of the signal base.
#include "ZinRT/Zin_Signal.h"

namespace ZinRT {

Zin_Signal::Zin_Signal(uint32_t type, uint32_t position, uint32_t resetLevel,
                       const std::string& name)
    : Zin_SignalBase(type, name), position_(position), resetLevel_(resetLevel) {}

Zin_Signal::Zin_Signal(const Zin_Signal&) = default;

Zin_Signal& Zin_Signal::operator=(const Zin_Signal&) = default;

Zin_Signal::~Zin_Signal() = default;

}  // namespace ZinRT
