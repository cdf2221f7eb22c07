// The host side of the hub protocol (docs/hub-protocol.md) over a PinBench, built on ZinHub's
// codec and CRC: status records, stage images, request replies and capture read-outs.
#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "PinBench.h"
#include "ZinHub/Crc16.h"
#include "ZinHub/HubCodec.h"

namespace RtlTest {

enum Op : uint32_t { kHubInfo = 0, kStage = 1, kCommit = 2, kCapture = 3, kClear = 4, kStatus = 5 };

using ZinHub::appendNumber;
using ZinHub::crc16;
using CaptureWord = ZinHub::CaptureWord;
inline uint64_t number(const Bits& bits, size_t first, size_t length) {
  return ZinHub::readNumber(bits, first, static_cast<unsigned>(length));
}
inline bool crcOk(const Bits& bits, size_t first, size_t length) {
  return crc16(bits, first, length + 16) == 0;
}

// An output image for a stage scan.
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
  HubClient(Bench& bench, uint32_t waitBits = 64) : bench_(bench), wait_(waitBits) {}

  // One DR scan of the given TDI bits; returns everything TDO gave.
  Bits raw(const Bits& in, size_t stopAfter = SIZE_MAX) {
    Bits out = bench_.dr(in, stopAfter);
    last_ = ZinHub::parseCaptureWord(out);
    return out;
  }
  Bits scan(uint32_t op, uint32_t core, const Bits& payload, size_t stopAfter = SIZE_MAX) {
    Bits in;
    ZinHub::appendHeader(in, static_cast<ZinHub::HubOp>(op), core);
    in.insert(in.end(), payload.begin(), payload.end());
    return raw(in, stopAfter);
  }
  const CaptureWord& lastCaptureWord() const { return last_; }

  // A record read (hub info or core status): checks the CRC and returns the record's bits.
  Bits record(uint32_t op, uint32_t core, size_t length) {
    const Bits out = scan(op, core, Bits(length + 16, 0));
    if (!crcOk(out, 16, length)) throw std::runtime_error("record CRC mismatch");
    return Bits(out.begin() + 16, out.begin() + 16 + static_cast<long>(length));
  }

  // A stage scan's TDI: header, the image's number and its CRC.
  static Bits stageScan(uint32_t core, const Image& image) {
    return ZinHub::stageRequest(core, stageNumber(image));
  }
  void stage(uint32_t core, const Image& image) { raw(stageScan(core, image)); }

  // A request op: returns the reply bits after the start bit, or nothing without a start bit.
  std::optional<Bits> request(uint32_t op, uint32_t core, size_t replyLength) {
    const Bits out = scan(op, core, Bits(wait_ + 1 + replyLength, 0));
    const auto at = ZinHub::findReply(out, static_cast<unsigned>(wait_));
    if (!at) return std::nullopt;
    return Bits(out.begin() + static_cast<long>(*at),
                out.begin() + static_cast<long>(*at + replyLength));
  }
  // Commit or clear: the 8-bit result (bit 0 done, bit 1 refused), -1 without an answer.
  int result(uint32_t op, uint32_t core) {
    const auto reply = request(op, core, 8);
    return reply ? static_cast<int>(number(*reply, 0, 8)) : -1;
  }

  // Capture of a core with a async and s sync inputs; checks the CRC.
  std::vector<InputReading> capture(uint32_t core, size_t a, size_t s) {
    const size_t n = 4 * a + 6 * s;
    const auto reply = request(kCapture, core, n + 16);
    if (!reply) throw std::runtime_error("capture: no start bit");
    if (!crcOk(*reply, 0, n)) throw std::runtime_error("capture: CRC mismatch");
    const auto b = [&](size_t k) { return (*reply)[n - 1 - k] != 0; };
    std::vector<InputReading> r;
    for (size_t i = 0; i < a; ++i)
      r.push_back({b(4 * i), b(4 * i + 1), b(4 * i + 2), false, false});
    for (size_t i = 0; i < s; ++i) {
      const size_t o = 4 * a + 6 * i;
      r.push_back({b(o), b(o + 1), b(o + 2), b(o + 3), b(o + 4)});
    }
    return r;
  }

 private:
  Bench& bench_;
  size_t wait_;
  CaptureWord last_{};
};

}  // namespace RtlTest
