// The library's exported functions on a session whose transport is the simulated target.
#include <gtest/gtest.h>

#include <mutex>
#include <random>

#include "SimTestUtil.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"

namespace {

using ZinRT::ZinMOX_ValueMap;

constexpr uint32_t kOk = 0;
constexpr uint32_t kFailed = 0x80000000u;

// The demo design's cores.
ZIN_CORE_REF kFull{0, 1, 0};
ZIN_CORE_REF kMiddle{0, 1, 1};
ZIN_CORE_REF kEarly{0, 1, 2};
ZIN_CORE_REF kOther{0, 1, 3};

struct Message {
  uint32_t code;
  std::string text;
};

class EndToEnd : public ::testing::Test {
 protected:
  void open(std::shared_ptr<ZinSim::Target> t) {
    target = std::move(t);
    handle = ZinJtag_openSession(target);
    ZinJtag_setMessageHandler(handle, &EndToEnd::onMessage, this);
  }
  void SetUp() override { open(std::make_shared<ZinSim::Target>()); }
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

TEST_F(EndToEnd, TheThreeStatusLayoutsDecode) {
  struct Expected {
    ZIN_CORE_REF ref;
    std::vector<uint32_t> fields;
  };
  const std::vector<Expected> cores = {
      {kFull, {165, 9, 10, 2, 1, 1, 4, 0, 16, 12, 16, 8}},
      {kMiddle, {165, 9, 6, 5, 3, 0, 0, 0, 8, 4, 8, 4}},
      {kEarly, {165, 9, 5, 1, 0, 0, 0, 0, 4, 2, 4, 2}},
  };
  for (Expected e : cores) {
    ZINMOX_CORE_INFO info{};
    ASSERT_EQ(ZinMOX_getInfo(handle, &e.ref, &info), kOk);
    const uint32_t* fields = &info.manufacturer_id;
    EXPECT_EQ(std::vector<uint32_t>(fields, fields + 12), e.fields) << e.ref.coreIndex;
  }
  ZINMOX_CORE_INFO info{};
  EXPECT_EQ(ZinMOX_getInfo(handle, &kOther, &info), kFailed);
  uint32_t isMox = 1;
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &kOther, &isMox), kOk);
  EXPECT_EQ(isMox, 0u);
  takeMessages();
}

TEST_F(EndToEnd, InitCoreOnACoreOfAnotherTypeFails) {
  EXPECT_EQ(ZinMOX_initCore(handle, &kOther), kFailed);
  const std::vector<Message> got = takeMessages();
  ASSERT_EQ(got.size(), 2u);
  EXPECT_EQ(got[0].code, ZINJTAG_MSG_ERROR);
  EXPECT_EQ(got[0].text, "ZinMOX_initCore() for the wrong core type or non-existant core.");
  EXPECT_EQ(got[1].code, ZINJTAG_MSG_ABORT);
  EXPECT_EQ(got[1].text, "Zin abort command");
  ZIN_CORE_REF nowhere{9, 9, 9};
  EXPECT_EQ(ZinMOX_initCore(handle, &nowhere), kFailed);
  EXPECT_EQ(takeMessages().size(), 2u);
}

TEST_F(EndToEnd, ATransferFailureReachesTheHostAndChangesNothing) {
  ASSERT_EQ(ZinMOX_initCore(handle, &kFull), kOk);
  target->failNextTransfer("ZinSim test: cable unplugged");
  ZinMOX_ValueMap values{{"async_out_data", "FFFF"}};
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  EXPECT_EQ(ZinMOX_writeValues(handle, &kFull, &word), kFailed);
  const std::vector<Message> got = takeMessages();
  ASSERT_EQ(got.size(), 1u);
  EXPECT_EQ(got[0].text, "ZinSim test: cable unplugged");
  EXPECT_EQ(target->asyncOutputLevels(kFull), std::string(16, '0'));
}

TEST_F(EndToEnd, WholePortsOfALargeCore) {
  constexpr uint32_t kBits = 4096;
  constexpr uint32_t kBytes = kBits / 8;
  ZIN_CORE_REF ref{3, 0, 1};
  open(ZinSimTest::targetWith({ZinSimTest::moxCore(ref, kBits, kBits, kBits, kBits)}));
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), kOk);
  std::mt19937 rng(11);
  auto randomBytes = [&](size_t n) {
    std::vector<uint8_t> v(n);
    for (uint8_t& b : v) b = static_cast<uint8_t>(rng());
    return v;
  };
  const std::vector<uint8_t> async = randomBytes(kBytes);
  const std::vector<uint8_t> steps = randomBytes(16 * kBytes);
  const std::vector<uint8_t> all(kBytes, 0xFF);
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, async.data(), all.data(), kBits, steps.data(),
                               all.data(), kBits),
            kOk);
  std::vector<uint8_t> value(kBytes), up(kBytes), down(kBytes), syncValue(kBytes), syncUp(kBytes),
      syncDown(kBytes), sUp(kBytes), sDown(kBytes);
  // The write's cycle ended with step 0 on the synchronous outputs; each read moves one step.
  for (uint32_t step = 0; step < 3; ++step) {
    ASSERT_EQ(ZinMOX_getPortBits(handle, &ref, value.data(), up.data(), down.data(), kBits,
                                 syncValue.data(), syncUp.data(), syncDown.data(), sUp.data(),
                                 sDown.data(), kBits),
              kOk);
    EXPECT_EQ(value, async);
    const std::vector<uint8_t> expected(steps.begin() + step * kBytes,
                                        steps.begin() + (step + 1) * kBytes);
    EXPECT_EQ(syncValue, expected) << "step " << step;
  }
  // Only the marked half of the asynchronous outputs changes.
  const std::vector<uint8_t> inverted = [&] {
    std::vector<uint8_t> v(async);
    for (uint8_t& b : v) b = static_cast<uint8_t>(~b);
    return v;
  }();
  std::vector<uint8_t> lowHalf(kBytes, 0);
  std::fill(lowHalf.begin(), lowHalf.begin() + kBytes / 2, 0xFF);
  ASSERT_EQ(
      ZinMOX_setPortBits(handle, &ref, inverted.data(), lowHalf.data(), kBits, nullptr, nullptr, 0),
      kOk);
  ASSERT_EQ(ZinMOX_getPortBits(handle, &ref, value.data(), nullptr, down.data(), kBits, nullptr,
                               nullptr, nullptr, nullptr, nullptr, 0),
            kOk);
  for (uint32_t i = 0; i < kBytes; ++i) {
    ASSERT_EQ(value[i], i < kBytes / 2 ? inverted[i] : async[i]) << "byte " << i;
    ASSERT_EQ(down[i], i < kBytes / 2 ? async[i] : 0) << "byte " << i;
  }
  EXPECT_TRUE(takeMessages().empty());
}

}  // namespace
