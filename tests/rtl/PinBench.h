// Pin-level driver for the Verilator models of the JTAG tops: it schedules the design clock and
// TCK on one time line (any ratio, optional jitter), walks the TAP and scans bit vectors.
#pragma once

#include <cstdint>
#include <functional>
#include <ostream>
#include <random>
#include <vector>

#include "ZinHub/PinJtagEngine.h"

namespace RtlTest {

using Bits = ZinHub::BitVector;  // one bit per element, bit 0 shifted first

// Periods in arbitrary time units; jitter is a fraction of each half period (0 to 0.9).
struct ClockPlan {
  double tckPeriod = 10;
  double clkPeriod = 10;
  double jitter = 0;
  uint32_t seed = 1;
};
inline void PrintTo(const ClockPlan& p, std::ostream* os) {
  *os << "TCK " << p.tckPeriod << ", clock " << p.clkPeriod << ", jitter " << p.jitter;
}

template <class Model>
class PinBench : public ZinHub::JtagPins {
 public:
  explicit PinBench(const ClockPlan& plan) : plan_(plan), rng_(plan.seed) {
    m_.clk_i = 0;
    m_.tck_i = 0;
    m_.tms_i = 1;
    m_.tdi_i = 0;
    m_.rst_ni = 0;
    m_.trst_ni = 0;
    m_.eval();
    nextClk_ = half(plan_.clkPeriod);
    runTo(4 * plan_.clkPeriod);
    m_.rst_ni = 1;
    m_.trst_ni = 1;
    m_.eval();
  }
  PinBench(const PinBench&) = delete;
  PinBench& operator=(const PinBench&) = delete;
  ~PinBench() override { m_.final(); }

  Model& model() { return m_; }
  // Called after every rising edge of the design clock.
  void onClockEdge(std::function<void(Model&)> observer) { observer_ = std::move(observer); }

  // Lets design-clock edges happen up to time t.
  void runTo(double t) {
    while (nextClk_ <= t) {
      now_ = nextClk_;
      m_.clk_i = !m_.clk_i;
      m_.eval();
      if (m_.clk_i && observer_) observer_(m_);
      nextClk_ += half(plan_.clkPeriod);
    }
    now_ = t;
  }
  void runClocks(uint64_t n) { runTo(now_ + static_cast<double>(n) * plan_.clkPeriod); }

  // One TCK cycle; returns TDO as sampled just before the rising edge.
  bool tck(bool tms, bool tdi) {
    m_.tms_i = tms;
    m_.tdi_i = tdi;
    m_.eval();
    runTo(now_ + half(plan_.tckPeriod));
    const bool tdo = m_.tdo_o;
    m_.tck_i = 1;
    m_.eval();
    runTo(now_ + half(plan_.tckPeriod));
    m_.tck_i = 0;
    m_.eval();
    return tdo;
  }
  bool clock(bool tms, bool tdi) override { return tck(tms, tdi); }

  void resetTap() {
    for (int i = 0; i < 5; ++i) tck(true, false);
    tck(false, false);
  }
  void pulseTrst() {
    m_.trst_ni = 0;
    m_.eval();
    runTo(now_ + plan_.tckPeriod);
    m_.trst_ni = 1;
    m_.eval();
    tck(false, false);  // Test-Logic-Reset -> Run-Test/Idle
  }
  void idle(int cycles) {
    for (int i = 0; i < cycles; ++i) tck(false, false);
  }

  // IR and whole DR scans go from Run-Test/Idle back to it through ZinHub's TAP walker. With
  // stopAfter set, a DR scan stops in Shift-DR after that many bits (for tests that cut a scan
  // short, then reset the TAP).
  void ir(uint32_t value, uint32_t length = 4) {
    engine_.queueIrScan(0, length, value);
    engine_.execute();
  }
  Bits dr(const Bits& in, size_t stopAfter = SIZE_MAX) {
    if (stopAfter >= in.size()) {
      engine_.queueDrScan(0, in);
      return engine_.execute().front();
    }
    for (bool tms : {true, false, false}) tck(tms, false);  // Select-DR, Capture-DR, Shift-DR
    Bits out;
    for (size_t i = 0; i < stopAfter; ++i) out.push_back(tck(false, in[i]));
    return out;
  }

 private:
  double half(double period) {
    std::uniform_real_distribution<double> d(-plan_.jitter, plan_.jitter);
    return period / 2 * (1 + d(rng_));
  }

  Model m_;
  ZinHub::PinJtagEngine engine_{*this};
  ClockPlan plan_;
  std::mt19937 rng_;
  double now_ = 0;
  double nextClk_ = 0;
  std::function<void(Model&)> observer_;
};

}  // namespace RtlTest
