// The demo design at its pins: TAP, discovery, status records, write/commit/read round trips at
// several clock ratios, broken and cut-short scans, busy, and resets in the middle of a scan.
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "PinBench.h"
#include "Vzinmox_demo_top.h"

namespace RtlTest {
namespace {

using Bench = PinBench<Vzinmox_demo_top>;
using Client = HubClient<Bench>;

constexpr uint32_t kUser1 = 0x8, kUser2 = 0x9, kBypass = 0xF;

struct DemoCore {
  uint32_t major, minor, revision, ao, so, ai, si;
};
const DemoCore kCores[] = {{10, 2, 1, 16, 8, 16, 12}, {6, 5, 3, 8, 4, 8, 4}, {5, 1, 0, 4, 2, 4, 2}};

Image fullImage(const DemoCore& c, std::mt19937& rng) {
  Image im{{}, std::vector<bool>(c.ao, true), std::vector<bool>(c.so, true), {}};
  for (uint32_t i = 0; i < c.ao; ++i) im.asyncValue.push_back(rng() & 1u);
  for (uint32_t j = 0; j < c.so; ++j) im.trains.push_back(static_cast<uint16_t>(rng()));
  return im;
}

class DemoHub : public ::testing::Test {
 protected:
  explicit DemoHub(ClockPlan plan = {}) : bench_(plan), hub_(bench_, waitBits(plan)) {
    reset(false);
  }
  // A TAP reset by TRST or by five TMS ones, then the hub's chain again.
  void reset(bool trst) {
    trst ? bench_.pulseTrst() : bench_.resetTap();
    bench_.ir(kUser1);
  }
  int stageAndCommit(uint32_t core, const Image& im) {
    hub_.stage(core, im);
    return hub_.result(kCommit, core);
  }
  // Captures a core's inputs and checks that the looped-back async ones show the image's values.
  std::vector<InputReading> captureHeld(uint32_t core, const Image& im) {
    const DemoCore& c = kCores[core];
    auto in = hub_.capture(core, c.ai, c.si);
    for (uint32_t i = 0; i < c.ao; ++i)  // core 2's async input 3 is a square wave
      EXPECT_TRUE((core == 2 && i == 3) || in[i].value == im.asyncValue[i]) << core << ":" << i;
    return in;
  }
  // Stages and commits a random image, lets the trains settle and reads the loopback back.
  void roundTrip(uint32_t core, std::mt19937& rng) {
    const DemoCore& c = kCores[core];
    const Image im = fullImage(c, rng);
    ASSERT_EQ(stageAndCommit(core, im), 1);
    bench_.runClocks(24);
    const auto in = captureHeld(core, im);
    for (uint32_t j = 0; j < c.so; ++j)
      EXPECT_EQ(in[c.ai + j].value, (im.trains[j] >> 15) & 1u) << "core " << core << " sync " << j;
    ASSERT_EQ(hub_.result(kClear, core), 1);
    const auto cleared = hub_.capture(core, c.ai, c.si);
    EXPECT_FALSE(cleared[0].up || cleared[0].down);
    EXPECT_TRUE(core != 0 || (cleared[c.ai + 8].up && cleared[c.ai + 8].syncDown));  // counter
    EXPECT_TRUE(core != 2 || cleared[3].up || cleared[3].down);  // the square wave
  }

  Bench bench_;
  Client hub_;
};

TEST_F(DemoHub, DiscoveryAndStatusRecords) {
  bench_.resetTap();
  EXPECT_EQ(number(bench_.dr(Bits(32, 0)), 0, 32), 0x1A5E0A5Bu);  // IDCODE after reset
  bench_.ir(kUser1);
  const Bits info = hub_.record(kInfo, 0, 32);
  EXPECT_TRUE(hub_.lastCaptureWord().hub);  // pattern 0x5A and version 1
  EXPECT_EQ(number(info, 0, 8), 1u);
  EXPECT_EQ(number(info, 8, 5), 4u);

  // The record head of each core; the status words after it are compared with the simulated
  // demo design's through OpenOCD (tests/openocd) and, for other widths, in tests/rtl-diff.
  for (uint32_t k = 0; k < 3; ++k) {
    const DemoCore& c = kCores[k];
    EXPECT_EQ(number(hub_.record(kStatus, k, 128), 0, 40),
              165u | 9u << 8 | c.major << 16 | c.minor << 24 | uint64_t{c.revision} << 32);
  }
  const Bits other = hub_.record(kStatus, 3, 128);  // the status-only core
  EXPECT_EQ(number(other, 0, 40), 165u | 3u << 8 | 2u << 16 | 1u << 24);
  EXPECT_EQ(number(other, 40, 64), 0x00C0FFEEu);
  EXPECT_EQ(number(hub_.record(kStatus, 9, 128), 0, 64), 0u);  // no core: zeros, valid CRC

  // A header without the key does nothing and shifts zeros.
  Bits keyless;
  appendNumber(keyless, 0x5A00, 16);  // op 0, core 0, key 0x5A
  keyless.resize(80, 0);
  EXPECT_EQ(number(bench_.dr(keyless), 16, 64), 0u);
  // A chain without a hub, and BYPASS, never show the capture pattern.
  for (uint32_t ir : {kUser2, kBypass}) {
    bench_.ir(ir);
    hub_.scan(kInfo, 0, Bits(48, 1));
    EXPECT_FALSE(hub_.lastCaptureWord().hub) << "IR " << ir;
  }
}

TEST_F(DemoHub, BrokenStagesAndResetsInTheMiddleOfAScanAreRefused) {
  std::mt19937 rng(7);
  const Image good = fullImage(kCores[1], rng);
  EXPECT_EQ(stageAndCommit(1, good), 1);
  EXPECT_FALSE(hub_.lastCaptureWord().stagedInvalid);

  // One flipped bit: the CRC fails, the next scan reports it and a commit refuses.
  Bits payload = Client::stageScan(1, fullImage(kCores[1], rng));
  payload[21] ^= 1;
  hub_.raw(payload);
  EXPECT_EQ(hub_.result(kCommit, 1), 2);
  EXPECT_TRUE(hub_.lastCaptureWord().stagedInvalid);
  // A stage one bit too long fails too.
  payload[21] ^= 1;
  payload.push_back(0);
  hub_.raw(payload);
  EXPECT_EQ(hub_.result(kCommit, 1), 2);
  payload.pop_back();
  // Commands to the status-only core are no operations: no start bit.
  EXPECT_EQ(hub_.result(kClear, 3), -1);

  // TRST in the middle of a stage scan: the valid image before it is gone, a commit refuses.
  hub_.stage(1, good);
  hub_.raw(payload, 56);
  reset(true);
  EXPECT_EQ(hub_.result(kCommit, 1), 2);
  EXPECT_FALSE(hub_.lastCaptureWord().busy);

  // TRST in the middle of a capture scan, right after the header: later scans work, and the
  // outputs still hold the first commit's values through all of the above.
  hub_.scan(kCapture, 1, Bits(200, 0), 17);
  reset(true);
  bench_.runClocks(24);
  captureHeld(1, good);
  EXPECT_FALSE(hub_.lastCaptureWord().busy);

  // TMS reset (five ones) cuts a stage scan short through Update-DR.
  hub_.raw(payload, 76);
  reset(false);
  EXPECT_EQ(hub_.result(kCommit, 1), 2);
  EXPECT_EQ(stageAndCommit(1, good), 1);
}

// TCK faster than, slower than and unrelated to the design clock.
class DemoHubRatio : public DemoHub, public ::testing::WithParamInterface<ClockPlan> {
 protected:
  DemoHubRatio() : DemoHub(GetParam()) {}
};

TEST_P(DemoHubRatio, RoundTripOnEveryCore) {
  std::mt19937 rng(GetParam().seed);
  for (uint32_t core = 0; core < 3; ++core) roundTrip(core, rng);
  // Busy: a commit scan that ends before its answer leaves the request to the hub. A stage
  // while it is pending is refused and leaves the image alone.
  const Image im = fullImage(kCores[0], rng);
  hub_.stage(0, im);
  hub_.scan(kCommit, 0, Bits(1, 0));
  hub_.stage(0, fullImage(kCores[0], rng));
  const bool wasBusy = hub_.lastCaptureWord().busy;
  bench_.runClocks(24);
  bench_.idle(8);
  EXPECT_EQ(hub_.result(kCommit, 0), 1);
  EXPECT_FALSE(hub_.lastCaptureWord().busy);
  bench_.runClocks(24);
  const auto in = hub_.capture(0, 16, 12);
  for (int i = 0; i < 16 && wasBusy; ++i) EXPECT_EQ(in[i].value, im.asyncValue[i]) << "async " << i;
  EXPECT_TRUE(wasBusy || GetParam().tckPeriod >= GetParam().clkPeriod);
}

const char* const kRatioNames[] = {"TckFaster", "TckSlower", "Jitter7to3", "Jitter3to7"};
INSTANTIATE_TEST_SUITE_P(Clocks, DemoHubRatio,
                         ::testing::Values(ClockPlan{1, 13, 0, 1}, ClockPlan{13, 1, 0, 2},
                                           ClockPlan{7, 3, 0.3, 3}, ClockPlan{3, 7, 0.3, 4}),
                         [](const auto& info) { return std::string(kRatioNames[info.index]); });

}  // namespace
}  // namespace RtlTest
