// One 8/8/8/8 MOX core with its outputs on pins: pulse trains cycle by cycle and a restage during
// play. (Random writes with update marks are the differential test's, tests/rtl-diff.)
#include <gtest/gtest.h>

#include "PinBench.h"
#include "Vzinmox_loop_top.h"

namespace RtlTest {
namespace {

using Bench = PinBench<Vzinmox_loop_top>;

struct Levels {
  uint32_t async, sync;
};

// A stage image of the 8/8/8/8 core with every bit marked for update.
Image image(uint32_t async, const std::vector<uint16_t>& trains) {
  Image im{{}, std::vector<bool>(8, true), std::vector<bool>(8, true), trains};
  for (int i = 0; i < 8; ++i) im.asyncValue.push_back((async >> i) & 1u);
  return im;
}

class LoopCore : public ::testing::Test {
 protected:
  explicit LoopCore(ClockPlan plan = {1, 40, 0, 1}) : bench_(plan), hub_(bench_, waitBits(plan)) {
    bench_.onClockEdge([this](auto& m) { trace_.push_back({m.async_out_o, m.sync_out_o}); });
    bench_.resetTap();
    bench_.ir(0x8);
  }
  // The edge at which the async outputs last changed to `value`.
  size_t edgeOf(uint32_t value) const {
    for (size_t e = trace_.size(); e-- > 1;)
      if (trace_[e].async == value && trace_[e - 1].async != value) return e;
    return SIZE_MAX;
  }
  void commit() { ASSERT_EQ(hub_.result(kCommit, 0), 1); }

  Bench bench_;
  HubClient<Bench> hub_;
  std::vector<Levels> trace_;
};

TEST_F(LoopCore, PulseTrainsPlayCycleByCycleAndSurviveARestage) {
  const std::vector<uint16_t> a{0x8001, 0x5555, 0xAAAA, 0x0F0F, 0x1234, 0xFFFE, 0x0001, 0xC3C3};
  hub_.stage(0, image(0x01, a));
  commit();
  hub_.stage(0, image(0x02, std::vector<uint16_t>(8, 0)));  // restaged while a plays
  bench_.runClocks(30);
  const size_t c = edgeOf(0x01);
  ASSERT_NE(c, SIZE_MAX);
  for (int j = 0; j < 8; ++j) {
    EXPECT_EQ((trace_[c].sync >> j) & 1u, 0u) << "old level through the commit cycle";
    for (size_t t = 0; t < 20; ++t) {
      const uint32_t step = t < 16 ? t : 15;
      EXPECT_EQ((trace_[c + 1 + t].sync >> j) & 1u, (a[static_cast<size_t>(j)] >> step) & 1u)
          << "output " << j << " cycle c+1+" << t;
    }
  }
  commit();  // the zero trains now play: every output falls to 0 one cycle after the commit
  bench_.runClocks(30);
  const size_t c2 = edgeOf(0x02);
  ASSERT_NE(c2, SIZE_MAX);
  EXPECT_EQ(trace_[c2].sync, 0xA5u);  // step 15 of every train of a
  EXPECT_EQ(trace_[c2 + 1].sync, 0x00u);
}

}  // namespace
}  // namespace RtlTest
