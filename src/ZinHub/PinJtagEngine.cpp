// Walks the TAP state machine pin by pin.
#include "ZinHub/PinJtagEngine.h"

#include <stdexcept>
#include <string>

namespace ZinHub {

namespace {

void checkDevice(uint32_t device) {
  if (device != 0) {
    throw std::invalid_argument("a pin-level engine drives one TAP; device " +
                                std::to_string(device) + " is not there");
  }
}

}  // namespace

void PinJtagEngine::queueIrScan(uint32_t device, uint32_t irLength, uint64_t instruction) {
  checkDevice(device);
  if (irLength == 0 || irLength > 64) throw std::invalid_argument("IR length must be 1 to 64");
  Scan scan;
  scan.ir = true;
  appendNumber(scan.tdi, instruction, irLength);
  queue_.push_back(std::move(scan));
}

void PinJtagEngine::queueDrScan(uint32_t device, BitVector tdi) {
  checkDevice(device);
  if (tdi.empty()) throw std::invalid_argument("a DR scan needs at least one bit");
  queue_.push_back(Scan{false, std::move(tdi)});
}

std::vector<BitVector> PinJtagEngine::execute() {
  std::vector<Scan> queue;
  queue.swap(queue_);
  if (!idle_) {
    walk({true, true, true, true, true, false});  // Test-Logic-Reset, Run-Test/Idle
    idle_ = true;
  }
  std::vector<BitVector> results;
  for (const Scan& scan : queue) {
    if (scan.ir) {
      walk({true, true, false, false});  // Select-DR, Select-IR, Capture-IR, Shift-IR
      shift(scan.tdi);
    } else {
      walk({true, false, false});  // Select-DR, Capture-DR, Shift-DR
      results.push_back(shift(scan.tdi));
    }
    walk({true, false});  // Update, Run-Test/Idle
  }
  return results;
}

void PinJtagEngine::walk(std::initializer_list<bool> tms) {
  for (bool level : tms) {
    pins_.clock(level, false);
  }
}

BitVector PinJtagEngine::shift(const BitVector& tdi) {
  BitVector tdo(tdi.size(), 0);
  for (size_t i = 0; i < tdi.size(); ++i) {
    // The last bit leaves Shift for Exit1.
    tdo[i] = pins_.clock(i + 1 == tdi.size(), tdi[i] != 0) ? 1 : 0;
  }
  return tdo;
}

}  // namespace ZinHub
