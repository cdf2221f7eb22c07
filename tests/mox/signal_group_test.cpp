// Signal objects: the default properties of a single signal, copying groups, and how a group
// stages its value bits into the port image and collects input bits from it.
#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <string>
#include <vector>

#include "internal/ZinMOX_Command.h"
#include "ZinMOX/ZinMOX_Signal.h"
#include "ZinMOX/ZinMOX_SignalGroup.h"
#include "ZinRT/Zin_SignalBase.h"

namespace {

using ZinRT::Zin_SignalBase;
using ZinRT::ZinMOX_Command;
using ZinRT::ZinMOX_SignalGroup;

std::string failureOf(const std::function<void()>& call) {
  try {
    call();
  } catch (const std::logic_error& error) {
    return error.what();
  }
  ADD_FAILURE() << "no std::logic_error";
  return "";
}

class SignalGroup : public ::testing::Test {
 protected:
  void SetUp() override {
    ZINMOX_CORE_INFO info{};
    info.async_input_count = 10;
    info.sync_input_count = 10;
    info.async_output_count = 10;
    info.sync_output_count = 10;
    command.initFromCoreInfo(info);
  }

  ZinMOX_SignalGroup group(uint32_t type, std::vector<uint32_t> positions, const char* name = "g") {
    return ZinMOX_SignalGroup(&command, type, positions, name, name);
  }

  ZinMOX_Command command;
};

TEST(Signal, CarriesTheDefaultProperties) {
  ZinRT::ZinMOX_Signal led(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, 3, 0, "led");
  EXPECT_EQ(led.getProperty("format"), "led:%b %a'");
  EXPECT_EQ(led.getProperty("reset_value"), "0");
  EXPECT_EQ(led.getProperty("low_value"), "0");
  EXPECT_EQ(led.getProperty("high_value"), "1");
  ZinRT::ZinMOX_Signal copy(led);
  EXPECT_EQ(copy.getProperty("format"), "led:%b %a'");
}

TEST_F(SignalGroup, CopiesShareThePortImage) {
  ZinMOX_SignalGroup original = group(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT, {5, 2, 9}, "bus");
  EXPECT_EQ(original.size(), 3u);
  {
    ZinMOX_SignalGroup copy(original);
    EXPECT_EQ(copy.getKeyName(), "bus");
    EXPECT_EQ(copy.getName(), "bus");
    EXPECT_EQ(copy.getType(), original.getType());
    EXPECT_EQ(copy.getPositionVector(), (std::vector<uint32_t>{5, 2, 9}));
    EXPECT_EQ(copy.getCommand(), &command);
  }
  ZinMOX_SignalGroup other = group(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, {1}, "one");
  other = original;
  EXPECT_EQ(other.getKeyName(), "bus");
  EXPECT_EQ(other.size(), 3u);
  EXPECT_EQ((original.getType() & ~Zin_SignalBase::SIGNAL_TYPE_GROUP),
            Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT);
}

TEST_F(SignalGroup, AsynchronousValuesGoToTheirPositions) {
  ZinMOX_SignalGroup g = group(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, {7, 3, 5});
  command.clearUpdateMasks();
  const uint8_t one = 0x01;
  g.setValues(&one, 1, 1);
  EXPECT_EQ(command.getAsyncOutValueBits(), "0000000100");
  EXPECT_EQ(command.getAsyncOutUpdateBits(), "0001010100");

  // Nine bits need two bytes; value bit 8 is bit 0 of the second byte.
  ZinMOX_SignalGroup nine =
      group(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT, {0, 1, 2, 3, 4, 5, 6, 7, 9}, "nine");
  const uint8_t value[2] = {0x00, 0x01};
  EXPECT_EQ(failureOf([&] { nine.setValues(value, 1, 1); }),
            "The size of the value is not large enough for the signal: nine");
  EXPECT_EQ(failureOf([&] { nine.setValues(nullptr, 2, 1); }), "Null value for signal: nine");
  EXPECT_EQ(command.getAsyncOutValueBits(), "0000000100") << "failed calls stage nothing";
  nine.setValues(value, 2, 1);
  EXPECT_EQ(command.getAsyncOutValueBits(), "0000000001");
  EXPECT_EQ(command.getAsyncOutUpdateBits(), "1111111101");
}

TEST_F(SignalGroup, SynchronousValuesHoldOrFollowTheStepVectors) {
  ZinMOX_SignalGroup g = group(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT, {4, 0, 8});
  const uint8_t five = 0x05;
  g.setValues(&five, 1, 0);  // step count 0 behaves like 1
  EXPECT_EQ(command.getSyncOutPulseTrains()[4], std::string(16, '1'));
  EXPECT_EQ(command.getSyncOutPulseTrains()[0], std::string(16, '0'));
  EXPECT_EQ(command.getSyncOutPulseTrains()[8], std::string(16, '1'));
  EXPECT_EQ(command.getSyncOutUpdateBits(), "1000100010");

  // Three vectors: the last repeats on steps 2 to 15.
  const uint8_t three[3] = {0x01, 0x02, 0x04};
  g.setValues(three, 3, 3);
  EXPECT_EQ(command.getSyncOutPulseTrains()[4], "1000000000000000");
  EXPECT_EQ(command.getSyncOutPulseTrains()[0], "0100000000000000");
  EXPECT_EQ(command.getSyncOutPulseTrains()[8], "0011111111111111");

  // Sixteen vectors need sixteen bytes for three bits.
  std::vector<uint8_t> steps(20);
  for (uint32_t t = 0; t < 20; ++t) steps[t] = static_cast<uint8_t>(t < 16 ? t % 8 : 7);
  EXPECT_EQ(failureOf([&] { g.setValues(steps.data(), 15, 16); }),
            "The size of the value is not large enough for the signal: g");
  EXPECT_EQ(command.getSyncOutPulseTrains()[4], "1000000000000000") << "nothing staged";
  // More than sixteen: the size check counts all of them, only the first sixteen are used.
  EXPECT_EQ(failureOf([&] { g.setValues(steps.data(), 19, 20); }),
            "The size of the value is not large enough for the signal: g");
  g.setValues(steps.data(), 20, 20);
  EXPECT_EQ(command.getSyncOutPulseTrains()[4], "0101010101010101");
  EXPECT_EQ(command.getSyncOutPulseTrains()[0], "0011001100110011");
  EXPECT_EQ(command.getSyncOutPulseTrains()[8], "0000111100001111");
}

TEST_F(SignalGroup, CollectsInputBitsWithoutClearingAny) {
  // Synchronous input bits: port bit i has value '1' only at i = 2, every activity '1' at i = 9.
  std::string syncBits;
  for (int i = 0; i < 10; ++i) syncBits += i == 2 ? "100000" : i == 9 ? "011110" : "000000";
  command.unpackSyncInputs(syncBits.c_str());
  std::string asyncBits;
  for (int i = 0; i < 10; ++i) asyncBits += i == 3 ? "1110" : "0000";
  command.unpackAsyncInputs(asyncBits.c_str());

  ZinMOX_SignalGroup sync = group(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT, {9, 2}, "s");
  uint8_t v = 0x80, up = 0, down = 0, syncUp = 0, syncDown = 0;
  sync.getValues(&v, &up, &down, &syncUp, &syncDown, 1);
  EXPECT_EQ(v, 0x82) << "bits already set stay set";
  EXPECT_EQ(up, 0x01);
  EXPECT_EQ(down, 0x01);
  EXPECT_EQ(syncUp, 0x01);
  EXPECT_EQ(syncDown, 0x01);

  ZinMOX_SignalGroup async = group(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT, {0, 3}, "a");
  uint8_t av = 0, aup = 0, adown = 0, untouchedUp = 0x5A, untouchedDown = 0xA5;
  async.getValues(&av, &aup, &adown, &untouchedUp, &untouchedDown, 1);
  EXPECT_EQ(av, 0x02);
  EXPECT_EQ(aup, 0x02);
  EXPECT_EQ(adown, 0x02);
  EXPECT_EQ(untouchedUp, 0x5A);
  EXPECT_EQ(untouchedDown, 0xA5);
  async.getValues(nullptr, nullptr, &adown, nullptr, nullptr, 1);

  ZinMOX_SignalGroup nine =
      group(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT, {0, 1, 2, 3, 4, 5, 6, 7, 8}, "nine");
  uint8_t small[2] = {0x11, 0x22};
  EXPECT_EQ(failureOf([&] { nine.getValues(small, nullptr, nullptr, nullptr, nullptr, 1); }),
            "The size of the value is not large enough for the signal: nine");
  EXPECT_EQ(small[0], 0x11);
}

}  // namespace
