// One 8/8/8/8 MOX core with its outputs on pins: pulse trains cycle by cycle, a restage during
// play, update marks, and random writes checked against a model of the outputs.
#include <gtest/gtest.h>

#include <cstdlib>
#include <random>
#include <utility>

#include "HubClient.h"
#include "Vzinmox_loop_top.h"

namespace RtlTest {
namespace {

using Bench = PinBench<Vzinmox_loop_top>;

struct Levels {
  uint32_t async, sync;
};

// A stage image of the 8/8/8/8 core from bit masks and trains.
Image image(uint32_t async, uint32_t asyncMarks, const std::vector<uint16_t>& trains,
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

class LoopCore : public ::testing::Test {
 protected:
  explicit LoopCore(ClockPlan plan = {1, 40, 0, 1}) : bench_(plan), hub_(bench_, waitBits(plan)) {
    bench_.onClockEdge([this](Vzinmox_loop_top& m) {
      trace_.push_back({m.async_out_o, m.sync_out_o});
    });
    bench_.resetTap();
    bench_.ir(0x8);
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

// The activity a 16-step train leaves on a sync input whose level was `from`: {up, down}.
std::pair<bool, bool> trainActivity(bool from, uint16_t train) {
  bool up = false, down = false, level = from;
  for (int t = 0; t < 16; ++t) {
    const bool next = (train >> t) & 1u;
    up |= next && !level;
    down |= !next && level;
    level = next;
  }
  return {up, down};
}

// Random images and marks under random clock ratios with jitter, against a model of the outputs
// and of the activity that each commit leaves on the loopback inputs. ZINMOX_RTL_ITERATIONS sets
// the number of sessions of 4 writes, each with its own clocks (the long run sets thousands).
TEST(LoopCoreRandom, RandomWritesAndActivityMatchTheModel) {
  const char* env = std::getenv("ZINMOX_RTL_ITERATIONS");
  const long sessions = env ? std::strtol(env, nullptr, 10) : 4;
  std::mt19937 rng(2024);
  for (long session = 0; session < sessions; ++session) {
    std::uniform_real_distribution<double> period(1, 20), jitter(0, 0.4);
    const ClockPlan plan{period(rng), period(rng), jitter(rng), static_cast<uint32_t>(rng())};
    SCOPED_TRACE(::testing::PrintToString(plan));
    Bench bench(plan);
    HubClient<Bench> hub(bench, waitBits(plan));
    bench.resetTap();
    bench.ir(0x8);
    uint32_t async = 0, sync = 0;
    for (int r = 0; r < 4; ++r) {
      std::vector<uint16_t> trains;
      for (int j = 0; j < 8; ++j) trains.push_back(static_cast<uint16_t>(rng()));
      const uint32_t v = rng() & 0xFF, am = rng() & 0xFF, sm = rng() & 0xFF;
      hub.stage(0, image(v, am, trains, sm));
      ASSERT_EQ(hub.result(kClear, 0), 1);
      ASSERT_EQ(hub.result(kCommit, 0), 1);
      const uint32_t newAsync = (async & ~am) | (v & am);
      uint32_t newSync = sync, syncUp = 0, syncDown = 0;
      for (int j = 0; j < 8; ++j) {
        if (((sm >> j) & 1u) == 0) continue;
        const uint16_t train = trains[static_cast<size_t>(j)];
        const auto [up, down] = trainActivity((sync >> j) & 1u, train);
        syncUp |= uint32_t{up} << j;
        syncDown |= uint32_t{down} << j;
        newSync = (newSync & ~(1u << j)) | (((train >> 15) & 1u) << j);
      }
      bench.runClocks(24);
      ASSERT_EQ(bench.model().async_out_o, newAsync) << "round " << r;
      ASSERT_EQ(bench.model().sync_out_o, newSync) << "round " << r;
      const auto in = hub.capture(0, 8, 8);
      for (size_t i = 0; i < 8; ++i) {
        const InputReading& a = in[i];
        const InputReading& y = in[8 + i];
        ASSERT_EQ(a.value, (newAsync >> i) & 1u) << "round " << r << " async " << i;
        ASSERT_EQ(a.up, ((newAsync & ~async) >> i) & 1u) << "round " << r << " async " << i;
        ASSERT_EQ(a.down, ((async & ~newAsync) >> i) & 1u) << "round " << r << " async " << i;
        ASSERT_EQ(y.value, (newSync >> i) & 1u) << "round " << r << " sync " << i;
        ASSERT_EQ(y.up, (syncUp >> i) & 1u) << "round " << r << " sync " << i;
        ASSERT_EQ(y.down, (syncDown >> i) & 1u) << "round " << r << " sync " << i;
        ASSERT_EQ(y.syncUp, y.up);
        ASSERT_EQ(y.syncDown, y.down);
      }
      async = newAsync;
      sync = newSync;
    }
  }
}

}  // namespace
}  // namespace RtlTest
