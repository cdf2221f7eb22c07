// A core with a status word, per-type physical signal counts and a store of signals.
#include "ZinRT/Zin_SignalCore.h"

#include "ZinRT/Zin_Signal.h"

#include <algorithm>
#include <stdexcept>

namespace ZinRT {

Zin_SignalCore::Zin_SignalCore(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo,
                               const unsigned char* status, uint32_t statusBitCount)
    : Zin_Core(handle, coreRef, coreInfo),
      status_(status, statusBitCount / 8 + (statusBitCount % 8 != 0 ? 1 : 0)) {}

Zin_SignalCore::~Zin_SignalCore() = default;

void Zin_SignalCore::addSignal(Zin_SignalBase* signal) {
  if (signal == nullptr) throw std::invalid_argument("Zin_SignalCore::addSignal: null signal");
  signals_.push_back(signal);
}

Zin_SignalBase* Zin_SignalCore::getSignal(const std::string& name, uint32_t type,
                                          uint32_t position) {
  for (Zin_SignalBase* signal : signals_) {
    if (signal->getName() != name || signal->getType() != type) continue;
    // Only single signals have a position; a group matches on name and type alone.
    const auto* single = dynamic_cast<const Zin_Signal*>(signal);
    if (single == nullptr || single->getPosition() == position) return signal;
  }
  return nullptr;
}

void Zin_SignalCore::removeSignal(Zin_SignalBase* signal) {
  signals_.erase(std::remove(signals_.begin(), signals_.end(), signal), signals_.end());
}

uint32_t Zin_SignalCore::getCorePhysicalSignalCount(uint32_t type) const {
  const auto it = physicalCounts_.find(type);
  return it != physicalCounts_.end() ? it->second : 0;
}

void Zin_SignalCore::setCorePhysicalSignalCount(uint32_t type, uint32_t count) {
  physicalCounts_[type] = count;
}

void Zin_SignalCore::setCorePhysicalSignalCounts() {}

}  // namespace ZinRT
