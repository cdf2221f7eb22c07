// Drives the pins of a verilated design with the hub's ports (clk_i, rst_ni, tck_i, tms_i, tdi_i,
// trst_ni, tdo_o). The design clock runs free against TCK: every TCK half period lets a fixed,
// non-integer number of design clock half cycles pass.
#ifndef ZINMOX_RTLSIM_MODELPINS_H
#define ZINMOX_RTLSIM_MODELPINS_H

#include <cstdint>

#include "ZinHub/PinJtagEngine.h"

namespace ZinRtl {

/// Design clock half cycles per TCK half period, as a fraction. The default 7/5 gives 1.4 design
/// cycles per TCK cycle, so the two clocks drift through every phase relation.
struct ClockRatio {
  unsigned designHalfCycles = 7;
  unsigned tckHalfPeriods = 5;
};

template <class Model>
class ModelPins final : public ZinHub::JtagPins {
 public:
  ModelPins(Model& model, ClockRatio ratio) : model_(model), ratio_(ratio) {
    if (ratio_.designHalfCycles == 0 || ratio_.tckHalfPeriods == 0) ratio_ = ClockRatio{};
  }

  /// Holds both resets for a few design cycles with TCK low, then releases them.
  void powerOn() {
    model_.clk_i = 0;
    model_.tck_i = 0;
    model_.tms_i = 1;
    model_.tdi_i = 0;
    setResets(true, true);
    runDesignCycles(8);
    setResets(false, false);
    runDesignCycles(4);
  }

  /// One step of a bit-bang adapter: the design clock advances, then the pins take their levels.
  void setPins(bool tck, bool tms, bool tdi) {
    advanceDesign();
    model_.tck_i = tck;
    model_.tms_i = tms;
    model_.tdi_i = tdi;
    model_.eval();
  }

  bool tdo() const { return model_.tdo_o != 0; }

  /// Asserts (true) or releases the TAP reset and the design reset.
  void setResets(bool trst, bool srst) {
    model_.trst_ni = !trst;
    model_.rst_ni = !srst;
    model_.eval();
  }

  /// Lets design clock cycles pass with the JTAG pins unchanged.
  void runDesignCycles(uint64_t cycles) {
    for (uint64_t i = 0; i < 2 * cycles; ++i) toggleDesignClock();
  }

  bool clock(bool tms, bool tdi) override {
    setPins(false, tms, tdi);
    const bool out = tdo();
    setPins(true, tms, tdi);
    return out;
  }

  uint64_t designCycles() const { return designHalfCycles_ / 2; }

 private:
  void toggleDesignClock() {
    model_.clk_i = !model_.clk_i;
    model_.eval();
    ++designHalfCycles_;
  }

  void advanceDesign() {
    phase_ += ratio_.designHalfCycles;
    while (phase_ >= ratio_.tckHalfPeriods) {
      phase_ -= ratio_.tckHalfPeriods;
      toggleDesignClock();
    }
  }

  Model& model_;
  ClockRatio ratio_;
  unsigned phase_ = 0;
  uint64_t designHalfCycles_ = 0;
};

}  // namespace ZinRtl

#endif
