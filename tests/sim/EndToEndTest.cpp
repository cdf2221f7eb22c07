// The library's exported functions on a session whose transport is the simulated target: named
// values, pulse trains and activity through the demo design's loopback. (Status layouts, wrong
// core types, transfer failures and the widest ports are checked against the scripted target in
// tests/mox and against the simulator alone in ModelTest.)
#include <gtest/gtest.h>

#include <mutex>

#include "SimTestUtil.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"

namespace {

using ZinRT::ZinMOX_ValueMap;

constexpr uint32_t kOk = 0;

// The demo design's full-layout core.
ZIN_CORE_REF kFull{0, 1, 0};

struct Message {
  uint32_t code;
  std::string text;
};

class EndToEnd : public ::testing::Test {
 protected:
  void SetUp() override {
    target = std::make_shared<ZinSim::Target>();
    handle = ZinJtag_openSession(target);
    ZinJtag_setMessageHandler(handle, &EndToEnd::onMessage, this);
  }
  void TearDown() override { ZinJtag_closeSession(handle); }

  static void onMessage(void* user, uint32_t, uint32_t code, const char* text) {
    auto* self = static_cast<EndToEnd*>(user);
    std::lock_guard<std::mutex> lock(self->mutex);
    self->messages.push_back({code, text});
  }
  std::vector<Message> takeMessages() {
    std::lock_guard<std::mutex> lock(mutex);
    return std::exchange(messages, {});
  }

  void defineBus(ZIN_CORE_REF ref, const char* name, uint32_t type, std::vector<uint32_t> bits) {
    ASSERT_EQ(
        ZinMOX_defineBus(handle, &ref, name, type, bits.data(), static_cast<uint32_t>(bits.size())),
        kOk);
  }
  void write(ZIN_CORE_REF ref, ZinMOX_ValueMap values) {
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), kOk);
  }
  ZinMOX_ValueMap read(ZIN_CORE_REF ref) {
    ZinMOX_ValueMap values;
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    EXPECT_EQ(ZinMOX_readValues(handle, &ref, &word), kOk);
    return values;
  }
  static unsigned long number(const ZinMOX_ValueMap& values, const std::string& key) {
    auto it = values.find(key);
    if (it == values.end()) {
      ADD_FAILURE() << "no key " << key;
      return ~0ul;
    }
    return std::stoul(it->second, nullptr, 16);
  }

  std::shared_ptr<ZinSim::Target> target;
  uint32_t handle = 0;
  std::mutex mutex;
  std::vector<Message> messages;
};

TEST_F(EndToEnd, NamedOutputsComeBackThroughTheLoopback) {
  ASSERT_EQ(ZinMOX_initCore(handle, &kFull), kOk);
  defineBus(kFull, "ctl", ZINMOX_ASYNC_OUTPUT, {0, 1, 2, 3, 4, 5, 6, 7});
  defineBus(kFull, "ctl_in", ZINMOX_ASYNC_INPUT, {0, 1, 2, 3, 4, 5, 6, 7});
  defineBus(kFull, "swapped", ZINMOX_ASYNC_INPUT, {15, 14, 13, 12});
  write(kFull, {{"ctl", "A5"}});
  EXPECT_EQ(target->asyncOutputLevels(kFull), "1010010100000000");
  ZinMOX_ValueMap in = read(kFull);
  EXPECT_EQ(number(in, "ctl_in"), 0xA5u);
  EXPECT_EQ(number(in, "ctl_in.activity_up"), 0xA5u);
  EXPECT_EQ(number(in, "swapped"), 0u);
  write(kFull, {{"async_out_data", "C003"}});
  in = read(kFull);
  EXPECT_EQ(number(in, "async_in_data"), 0xC003u);
  EXPECT_EQ(number(in, "ctl_in.activity_down"), 0xA4u);
  EXPECT_EQ(number(in, "swapped"), 0x3u);  // bits 15 and 14 as value bits 0 and 1
  EXPECT_TRUE(takeMessages().empty());
}

TEST_F(EndToEnd, PulseTrainIsSeenCycleByCycleThenHeld) {
  ASSERT_EQ(ZinMOX_initCore(handle, &kFull), kOk);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &kFull, "burst", ZINMOX_SYNC_OUTPUT, 2), kOk);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &kFull, "burst_in", ZINMOX_SYNC_INPUT, 2), kOk);
  const std::string steps = "1101000110110010";  // step t = character t
  std::string text;                              // one byte per step, step 0 least significant
  for (int t = 15; t >= 0; --t) text += steps[t] == '1' ? "01" : "00";
  write(kFull, {{"burst.pulsetrain", text}});
  // Each command sequence is one clock cycle: the write's cycle ends with step 0 on the output,
  // and each read samples one step further.
  std::string seen;
  for (int i = 0; i < 20; ++i) seen += number(read(kFull), "burst_in") ? '1' : '0';
  EXPECT_EQ(seen, steps + std::string(4, steps[15]));
  EXPECT_EQ(target->syncOutputLevels(kFull)[2], steps[15]);
}

TEST_F(EndToEnd, AOneCyclePulseIsSeenAsActivityAndClearedByTheRead) {
  ASSERT_EQ(ZinMOX_initCore(handle, &kFull), kOk);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &kFull, "strobe", ZINMOX_ASYNC_OUTPUT, 3), kOk);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &kFull, "strobe_in", ZINMOX_ASYNC_INPUT, 3), kOk);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &kFull, "tick", ZINMOX_SYNC_INPUT, 8), kOk);
  read(kFull);
  write(kFull, {{"strobe", "1"}});
  write(kFull, {{"strobe", "0"}});
  ZinMOX_ValueMap in = read(kFull);
  EXPECT_EQ(number(in, "strobe_in"), 0u);
  EXPECT_EQ(number(in, "strobe_in.activity_up"), 1u);
  EXPECT_EQ(number(in, "strobe_in.activity_down"), 1u);
  // Sync input 8 shows bit 0 of the demo core's cycle counter: three cycles passed since the
  // last read, so its samples rose and fell in between.
  EXPECT_EQ(number(in, "tick.sync_activity_up"), 1u);
  EXPECT_EQ(number(in, "tick.sync_activity_down"), 1u);
  in = read(kFull);
  EXPECT_EQ(number(in, "strobe_in.activity_up"), 0u);
  EXPECT_EQ(number(in, "strobe_in.activity_down"), 0u);
  EXPECT_TRUE(takeMessages().empty());
}

}  // namespace
