// ZinMOX_Signal: a framework signal with the default properties of a MOX core's signals.
#include "ZinMOX/ZinMOX_Signal.h"

namespace ZinRT {

ZinMOX_Signal::ZinMOX_Signal(uint32_t type, uint32_t position, uint32_t resetLevel,
                             const std::string& name)
    : Zin_Signal(type, position, resetLevel, name) {
  setDefaultParameters();
}

ZinMOX_Signal::ZinMOX_Signal(const ZinMOX_Signal& other) = default;

ZinMOX_Signal& ZinMOX_Signal::operator=(const ZinMOX_Signal& other) = default;

ZinMOX_Signal::~ZinMOX_Signal() = default;

void ZinMOX_Signal::setDefaultParameters() {
  const std::string format = getName() + ":%b %a'";
  setProperty("format", format.c_str());
  setProperty("reset_value", "0");
  setProperty("low_value", "0");
  setProperty("high_value", "1");
}

}  // namespace ZinRT
