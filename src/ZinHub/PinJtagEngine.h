// A JtagEngine that walks the TAP state machine pin by pin, for a single TAP whose pins a
// program drives directly (a simulated model in process).
#ifndef ZINHUB_PINJTAGENGINE_H
#define ZINHUB_PINJTAGENGINE_H

#include <cstdint>
#include <initializer_list>
#include <vector>

#include "ZinHub/JtagEngine.h"

namespace ZinHub {

/// The pins of one TAP.
class JtagPins {
 public:
  virtual ~JtagPins() = default;
  /// One TCK cycle: TCK falls and TMS and TDI take their values, TDO is sampled, TCK rises.
  /// Returns the sampled TDO.
  virtual bool clock(bool tms, bool tdi) = 0;
};

/// Scans through device 0 only (the one TAP behind the pins). Before the first scan it walks
/// to Test-Logic-Reset (five TMS ones) and on to Run-Test/Idle, where it rests between scans.
class PinJtagEngine : public JtagEngine {
 public:
  explicit PinJtagEngine(JtagPins& pins) : pins_(pins) {}

  void queueIrScan(uint32_t device, uint32_t irLength, uint64_t instruction) override;
  void queueDrScan(uint32_t device, BitVector tdi) override;
  std::vector<BitVector> execute() override;

 private:
  struct Scan {
    bool ir = false;
    BitVector tdi;
  };
  void walk(std::initializer_list<bool> tms);
  BitVector shift(const BitVector& tdi);

  JtagPins& pins_;
  std::vector<Scan> queue_;
  bool idle_ = false;
};

}  // namespace ZinHub

#endif
