// Pin-level tests of the RTL: PinBench drives a Verilator model's JTAG tops with the design clock
// and TCK on one time line (any ratio, optional jitter); HubClient is the host side of the hub
// protocol (docs/hub-protocol.md) over it, built on ZinHub's codec and CRC.
#pragma once

#include <algorithm>
#include <cstdint>
#include <functional>
#include <optional>
#include <ostream>
#include <random>
#include <stdexcept>
#include <vector>

#include "ZinHub/Crc16.h"
#include "ZinHub/HubCodec.h"
#include "ZinHub/PinJtagEngine.h"

namespace RtlTest {

using Bits = ZinHub::BitVector;  // one bit per element, bit 0 shifted first
using ZinHub::appendNumber;

// Periods in arbitrary time units; jitter is a fraction of each half period (0 to 0.9).
struct ClockPlan {
  double tckPeriod = 10, clkPeriod = 10, jitter = 0;
  uint32_t seed = 1;
};
inline void PrintTo(const ClockPlan& p, std::ostream* os) {
  *os << "TCK " << p.tckPeriod << ", clock " << p.clkPeriod << ", jitter " << p.jitter;
}

template <class Model>
class PinBench : public ZinHub::JtagPins {
 public:
  explicit PinBench(const ClockPlan& plan) : plan_(plan), rng_(plan.seed) {
    m_.clk_i = m_.tck_i = m_.tdi_i = m_.rst_ni = m_.trst_ni = 0;
    m_.tms_i = 1;
    m_.eval();
    nextClk_ = half(plan_.clkPeriod);
    runTo(4 * plan_.clkPeriod);
    m_.rst_ni = m_.trst_ni = 1;
    m_.eval();
  }
  ~PinBench() override { m_.final(); }

  // Called after every rising edge of the design clock.
  void onClockEdge(std::function<void(Model&)> observer) { observer_ = std::move(observer); }

  // Lets design-clock edges happen up to time t.
  void runTo(double t) {
    for (; nextClk_ <= t; nextClk_ += half(plan_.clkPeriod)) {
      now_ = nextClk_;
      m_.clk_i = !m_.clk_i;
      m_.eval();
      if (m_.clk_i && observer_) observer_(m_);
    }
    now_ = t;
  }
  void runClocks(uint64_t n) { runTo(now_ + static_cast<double>(n) * plan_.clkPeriod); }

  // One TCK cycle; returns TDO as sampled just before the rising edge.
  bool clock(bool tms, bool tdi) override {
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
  void idle(int cycles) {
    for (int i = 0; i < cycles; ++i) clock(false, false);
  }
  void resetTap() {
    for (int i = 0; i < 5; ++i) clock(true, false);
    idle(1);
  }
  void pulseTrst() {
    m_.trst_ni = 0;
    m_.eval();
    runTo(now_ + plan_.tckPeriod);
    m_.trst_ni = 1;
    m_.eval();
    idle(1);  // Test-Logic-Reset -> Run-Test/Idle
  }

  // IR and DR scans from Run-Test/Idle back to it; a DR scan with stopAfter below its length
  // stays in Shift-DR after that many bits (tests that cut a scan short, then reset the TAP).
  void ir(uint32_t value) {
    engine_.queueIrScan(0, 4, value);
    engine_.execute();
  }
  Bits dr(const Bits& in, size_t stopAfter = SIZE_MAX) {
    if (stopAfter >= in.size()) {
      engine_.queueDrScan(0, in);
      return engine_.execute().front();
    }
    for (bool tms : {true, false, false}) clock(tms, false);  // to Shift-DR
    Bits out;
    for (size_t i = 0; i < stopAfter; ++i) out.push_back(clock(false, in[i]));
    return out;
  }

 private:
  double half(double period) {
    return period / 2 *
           (1 + std::uniform_real_distribution<double>(-plan_.jitter, plan_.jitter)(rng_));
  }

  Model m_;
  ZinHub::PinJtagEngine engine_{*this};
  ClockPlan plan_;
  std::mt19937 rng_;
  double now_ = 0, nextClk_ = 0;
  std::function<void(Model&)> observer_;
};

using Op = ZinHub::HubOp;
using enum ZinHub::HubOp;

inline uint64_t number(const Bits& bits, size_t first, size_t length) {
  return ZinHub::readNumber(bits, first, static_cast<unsigned>(length));
}

struct Image {
  std::vector<bool> asyncValue, asyncMark, syncMark;
  std::vector<uint16_t> trains;  // bit t = step t
};

// The stage line's number, least significant bit first: L = 2A + 17S + 1 bits.
inline Bits stageNumber(const Image& im) {
  const size_t a = im.asyncValue.size(), s = im.trains.size(), l = 2 * a + 17 * s + 1;
  Bits n(l, 0);
  for (size_t i = 0; i < a; ++i) {
    n[l - 2 - i] = im.asyncValue[i];
    n[l - 2 - a - 16 * s - i] = im.asyncMark[i];
  }
  for (size_t j = 0; j < s; ++j) {
    for (size_t t = 0; t < 16; ++t) n[l - 2 - a - 16 * j - t] = (im.trains[j] >> t) & 1u;
    n[s - 1 - j] = im.syncMark[j];
  }
  return n;
}

struct InputReading {
  bool value, up, down, syncUp, syncDown;
};

// Wait bits for a request: about ten design clock periods, at least the default 64.
inline size_t waitBits(const ClockPlan& plan) {
  return std::max<size_t>(64, static_cast<size_t>(10 * plan.clkPeriod / plan.tckPeriod) + 16);
}

template <class Bench>
class HubClient {
 public:
  HubClient(Bench& bench, size_t waitBits) : bench_(bench), wait_(waitBits) {}

  Bits raw(const Bits& in, size_t stopAfter = SIZE_MAX) {
    Bits out = bench_.dr(in, stopAfter);
    last_ = ZinHub::parseCaptureWord(out);
    return out;
  }
  Bits scan(Op op, uint32_t core, const Bits& payload, size_t stopAfter = SIZE_MAX) {
    Bits in;
    ZinHub::appendHeader(in, op, core);
    in.insert(in.end(), payload.begin(), payload.end());
    return raw(in, stopAfter);
  }
  const ZinHub::CaptureWord& lastCaptureWord() const { return last_; }

  // A record read (hub info or core status) with its CRC checked.
  Bits record(Op op, uint32_t core, size_t length) {
    const Bits out = scan(op, core, Bits(length + 16, 0));
    if (ZinHub::crc16(out, 16, length + 16) != 0) throw std::runtime_error("record CRC mismatch");
    return Bits(out.begin() + 16, out.begin() + 16 + static_cast<long>(length));
  }

  static Bits stageScan(uint32_t core, const Image& image) {
    return ZinHub::stageRequest(core, stageNumber(image));
  }
  void stage(uint32_t core, const Image& image) { raw(stageScan(core, image)); }

  // A request op: the reply bits after the start bit, or nothing without a start bit.
  std::optional<Bits> request(Op op, uint32_t core, size_t replyLength) {
    const Bits out = scan(op, core, Bits(wait_ + 1 + replyLength, 0));
    const auto at = ZinHub::findReply(out, static_cast<unsigned>(wait_));
    if (!at) return std::nullopt;
    return Bits(out.begin() + static_cast<long>(*at),
                out.begin() + static_cast<long>(*at + replyLength));
  }
  // Commit or clear: the 8-bit result (bit 0 done, bit 1 refused), -1 without an answer.
  int result(Op op, uint32_t core) {
    const auto reply = request(op, core, 8);
    return reply ? static_cast<int>(number(*reply, 0, 8)) : -1;
  }

  // Capture of a core with a async and s sync inputs, CRC checked.
  std::vector<InputReading> capture(uint32_t core, size_t a, size_t s) {
    const size_t n = 4 * a + 6 * s;
    const auto reply = request(kCapture, core, n + 16);
    if (!reply || ZinHub::crc16(*reply, 0, n + 16) != 0)
      throw std::runtime_error("capture: no start bit or bad CRC");
    const auto b = [&](size_t k) { return (*reply)[n - 1 - k] != 0; };
    std::vector<InputReading> r;
    for (size_t i = 0; i < a; ++i)
      r.push_back({b(4 * i), b(4 * i + 1), b(4 * i + 2), false, false});
    for (size_t o = 4 * a; o < n; o += 6)
      r.push_back({b(o), b(o + 1), b(o + 2), b(o + 3), b(o + 4)});
    return r;
  }

 private:
  Bench& bench_;
  size_t wait_;
  ZinHub::CaptureWord last_{};
};

}  // namespace RtlTest
