// One 8/8/8/8 MOX core with its outputs on pins: pulse trains cycle by cycle, a restage during
// play, update marks, and random writes checked against a model of the outputs.
#include <gtest/gtest.h>

#include <cstdlib>
#include <random>

#include "HubClient.h"
#include "Vzinmox_loop_top.h"

namespace RtlTest {
namespace {

using Bench = PinBench<Vzinmox_loop_top>;

struct Levels {
  uint32_t async, sync;
};

class LoopCore : public ::testing::Test {
 protected:
  explicit LoopCore(ClockPlan plan = {1, 40, 0, 1}) : bench_(plan), hub_(bench_, waitBits(plan)) {
    bench_.onClockEdge([this](Vzinmox_loop_top& m) {
      trace_.push_back({m.async_out_o, m.sync_out_o});
    });
    bench_.resetTap();
    bench_.ir(0x8);
  }
  static Image image(uint32_t async, uint32_t asyncMarks, const std::vector<uint16_t>& trains,
                     uint32_t syncMarks) {
    Image im;
    for (int i = 0; i < 8; ++i) {
      im.asyncValue.push_back((async >> i) & 1u);
      im.asyncMark.push_back((asyncMarks >> i) & 1u);
      im.trains.push_back(trains[static_cast<size_t>(i)]);
      im.syncMark.push_back((syncMarks >> i) & 1u);
    }
    return im;
  }
  // The edge at which the async outputs last changed to `value`.
  size_t edgeOf(uint32_t value) const {
    for (size_t e = trace_.size(); e-- > 1;) {
      if (trace_[e].async == value && trace_[e - 1].async != value) return e;
    }
    return SIZE_MAX;
  }
  void commit() { ASSERT_EQ(hub_.result(kCommit, 0), 1); }

  Bench bench_;
  HubClient<Bench> hub_;
  std::vector<Levels> trace_;
};

TEST_F(LoopCore, PulseTrainsPlayCycleByCycleAndSurviveARestage) {
  std::vector<uint16_t> a{0x8001, 0x5555, 0xAAAA, 0x0F0F, 0x1234, 0xFFFE, 0x0001, 0xC3C3};
  std::vector<uint16_t> b(8, 0x0000);
  hub_.stage(0, image(0x01, 0xFF, a, 0xFF));
  commit();
  hub_.stage(0, image(0x02, 0xFF, b, 0xFF));  // restaged while a plays
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
  commit();  // b now plays: every output falls to 0 one cycle after the commit
  bench_.runClocks(30);
  const size_t c2 = edgeOf(0x02);
  ASSERT_NE(c2, SIZE_MAX);
  EXPECT_EQ(trace_[c2].sync, 0xA5u);  // step 15 of every train of a
  EXPECT_EQ(trace_[c2 + 1].sync, 0x00u);
}

TEST_F(LoopCore, UpdateMarksLeaveUnmarkedBitsAlone) {
  hub_.stage(0, image(0xFF, 0xFF, std::vector<uint16_t>(8, 0xFFFF), 0xFF));
  commit();
  hub_.stage(0, image(0x00, 0x0F, std::vector<uint16_t>(8, 0x0000), 0x33));
  commit();
  bench_.runClocks(20);
  EXPECT_EQ(bench_.model().async_out_o, 0xF0u);
  EXPECT_EQ(bench_.model().sync_out_o, 0xCCu);
  // A second commit of the same staged image commits it again.
  hub_.stage(0, image(0xAA, 0xFF, std::vector<uint16_t>(8, 0xFFFF), 0xFF));
  commit();
  bench_.runClocks(20);
  hub_.stage(0, image(0x55, 0x0F, std::vector<uint16_t>(8, 0), 0x00));
  commit();
  bench_.runClocks(20);
  EXPECT_EQ(bench_.model().async_out_o, 0xA5u);
  EXPECT_EQ(bench_.model().sync_out_o, 0xFFu);
}

// Random images and marks against a model of the outputs, read back through the loopback.
// ZINMOX_RTL_ITERATIONS sets the number of rounds (the long run sets thousands).
TEST_F(LoopCore, RandomWritesMatchTheModel) {
  const char* env = std::getenv("ZINMOX_RTL_ITERATIONS");
  const long rounds = env ? std::strtol(env, nullptr, 10) : 6;
  std::mt19937 rng(2024);
  uint32_t async = 0, sync = 0;
  for (long r = 0; r < rounds; ++r) {
    std::vector<uint16_t> trains;
    for (int j = 0; j < 8; ++j) trains.push_back(static_cast<uint16_t>(rng()));
    const uint32_t v = rng() & 0xFF, am = rng() & 0xFF, sm = rng() & 0xFF;
    hub_.stage(0, image(v, am, trains, sm));
    commit();
    async = (async & ~am) | (v & am);
    for (int j = 0; j < 8; ++j) {
      if ((sm >> j) & 1u)
        sync = (sync & ~(1u << j)) | (((trains[static_cast<size_t>(j)] >> 15) & 1u) << j);
    }
    bench_.runClocks(20);
    ASSERT_EQ(bench_.model().async_out_o, async) << "round " << r;
    ASSERT_EQ(bench_.model().sync_out_o, sync) << "round " << r;
    const auto in = hub_.capture(0, 8, 8);
    for (int i = 0; i < 8; ++i) {
      ASSERT_EQ(in[static_cast<size_t>(i)].value, (async >> i) & 1u) << "round " << r;
      ASSERT_EQ(in[static_cast<size_t>(8 + i)].value, (sync >> i) & 1u) << "round " << r;
    }
  }
}

}  // namespace
}  // namespace RtlTest
