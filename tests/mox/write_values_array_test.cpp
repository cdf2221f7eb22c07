// Writing packed value arrays to named outputs of a core: one transfer per value, or bursts of up
// to 16 step values per transfer, and the checks that run before anything is sent.
#include <initializer_list>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;

constexpr uint32_t kAsyncOut = 16, kSyncOut = 16;

class WriteArrays : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    core = initMoxCore(ref, 1, 0, kAsyncOut, kSyncOut);
    ASSERT_NE(core, nullptr);
    defineBus("s3", ZINMOX_SYNC_OUTPUT, s3);
    defineBus("s9", ZINMOX_SYNC_OUTPUT, s9);
    defineBus("a8", ZINMOX_ASYNC_OUTPUT, a8);
    defineBus("in", ZINMOX_ASYNC_INPUT, {0});
    transport->clearLog();
  }

  void defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits) {
    ASSERT_EQ(
        ZinMOX_defineBus(handle, &ref, name, type, bits.data(), static_cast<uint32_t>(bits.size())),
        0u);
  }

  // Calls the array overload with one value block per name.
  void write(const std::vector<std::string>& names, const std::vector<const uint8_t*>& values,
             const std::vector<uint32_t>& sizes, uint32_t valueCount, uint32_t burstMode) {
    core->writeValues(handle, ref, names, values.data(), sizes.data(),
                      static_cast<uint32_t>(names.size()), valueCount, burstMode);
  }

  std::string failureOf(const std::vector<std::string>& names,
                        const std::vector<const uint8_t*>& values,
                        const std::vector<uint32_t>& sizes, uint32_t valueCount,
                        uint32_t burstMode) {
    try {
      write(names, values, sizes, valueCount, burstMode);
    } catch (const std::logic_error& error) {
      return error.what();
    }
    ADD_FAILURE() << "no std::logic_error";
    return "";
  }

  std::vector<WriteImage> writes() {
    std::vector<WriteImage> images;
    for (const auto& transfer : transport->transfers()) {
      images.push_back(decodeWriteCommand(transfer.text, linePrefix(ref), kAsyncOut, kSyncOut));
    }
    return images;
  }

  // The step string that port bit positions[bit] carries when value `values[t]` is on step t.
  static std::string stepsOf(const std::vector<uint32_t>& values, uint32_t bit) {
    std::string steps;
    for (uint32_t v : values) steps.push_back(((v >> bit) & 1) ? '1' : '0');
    return steps;
  }

  static std::string marks(uint32_t width,
                           std::initializer_list<const std::vector<uint32_t>*> sets) {
    std::string result(width, '0');
    for (const auto* positions : sets) {
      for (uint32_t p : *positions) result[p] = '1';
    }
    return result;
  }

  ZinRT::ZinMOX_Core* core = nullptr;
  std::vector<uint32_t> s3{0, 1, 2}, s9{11, 10, 9, 8, 7, 6, 5, 4, 3},
      a8{8, 9, 10, 11, 12, 13, 14, 15};
};

TEST_F(WriteArrays, BurstOfTwentyValuesGoesOutInTwoTransfers) {
  std::vector<uint32_t> v3, v9;
  std::vector<uint8_t> bytes3, bytes9;
  for (uint32_t k = 0; k < 20; ++k) {
    v3.push_back((k * 3 + 1) & 7);
    v9.push_back((k * 37 + 100) & 0x1FF);
    bytes3.push_back(static_cast<uint8_t>(v3.back()));
    auto b = packValue(v9.back(), 2);
    bytes9.insert(bytes9.end(), b.begin(), b.end());
  }
  write({"s3", "S9"}, {bytes3.data(), bytes9.data()}, {20, 40}, 20, 1);
  std::vector<WriteImage> images = writes();
  ASSERT_EQ(images.size(), 2u);
  EXPECT_EQ(transport->flushCount(), 2u);

  const std::vector<uint32_t> first3(v3.begin(), v3.begin() + 16),
      first9(v9.begin(), v9.begin() + 16);
  std::vector<uint32_t> second3(v3.begin() + 16, v3.end()), second9(v9.begin() + 16, v9.end());
  second3.resize(16, v3[19]);  // value 19 fills steps 4 to 15
  second9.resize(16, v9[19]);
  const std::vector<std::pair<std::vector<uint32_t>, std::vector<uint32_t>>> expected = {
      {first3, first9}, {second3, second9}};
  for (std::size_t n = 0; n < 2; ++n) {
    SCOPED_TRACE(testing::Message() << "transfer " << n);
    for (uint32_t i = 0; i < 3; ++i)
      EXPECT_EQ(images[n].steps[s3[i]], stepsOf(expected[n].first, i));
    for (uint32_t i = 0; i < 9; ++i)
      EXPECT_EQ(images[n].steps[s9[i]], stepsOf(expected[n].second, i));
    EXPECT_EQ(images[n].syncUpdate, marks(kSyncOut, {&s3, &s9}));
    EXPECT_EQ(images[n].asyncUpdate, std::string(kAsyncOut, '0'));
  }
}

TEST_F(WriteArrays, WithoutBurstModeEachValueIsItsOwnTransfer) {
  const std::vector<uint8_t> values8 = {0x11, 0x82, 0xF3}, values3 = {1, 6, 3};
  // Any burst mode other than 1 means single values.
  write({"a8", "s3"}, {values8.data(), values3.data()}, {3, 3}, 3, 2);
  std::vector<WriteImage> images = writes();
  ASSERT_EQ(images.size(), 3u);
  for (uint32_t k = 0; k < 3; ++k) {
    SCOPED_TRACE(testing::Message() << "transfer " << k);
    std::string asyncValue;
    for (uint32_t p : a8) asyncValue.push_back(images[k].asyncValues[p]);
    EXPECT_EQ(asyncValue, unpackBits(&values8[k], 8));
    for (uint32_t i = 0; i < 3; ++i) {
      EXPECT_EQ(images[k].steps[s3[i]], std::string(16, ((values3[k] >> i) & 1) ? '1' : '0'));
    }
    EXPECT_EQ(images[k].asyncUpdate, marks(kAsyncOut, {&a8}));
    EXPECT_EQ(images[k].syncUpdate, marks(kSyncOut, {&s3}));
  }
}

TEST_F(WriteArrays, ChecksEveryEntryInOrderBeforeSendingAnything) {
  const uint8_t block[64] = {};
  const uint8_t* v = block;
  // Within one entry: lookup, burst mode, size, null pointer.
  EXPECT_EQ(failureOf({"nope"}, {nullptr}, {0}, 2, 1),
            "Could not find a signal with the name: nope");
  EXPECT_EQ(failureOf({"in"}, {v}, {64}, 1, 0), "Could not find a signal with the name: in");
  EXPECT_EQ(failureOf({"a8"}, {nullptr}, {0}, 2, 1),
            "Burst mode cannot be used with the non-synchronous output: a8");
  EXPECT_EQ(failureOf({"s9"}, {nullptr}, {3}, 2, 1),
            "The size of the value is not large enough for the signal: s9");
  EXPECT_EQ(failureOf({"s9"}, {nullptr}, {4}, 2, 1), "Invalid values for signal: s9");
  // The first failing entry decides.
  EXPECT_EQ(failureOf({"s3", "nope"}, {v, v}, {1, 64}, 2, 0),
            "The size of the value is not large enough for the signal: s3");
  EXPECT_EQ(failureOf({"s3", "a8"}, {v, v}, {2, 64}, 2, 1),
            "Burst mode cannot be used with the non-synchronous output: a8");
  // With no values to send the checks still run, and nothing is sent.
  EXPECT_EQ(failureOf({"s3", "s9"}, {v, nullptr}, {0, 0}, 0, 0), "Invalid values for signal: s9");
  write({"s3", "s9"}, {v, v}, {0, 0}, 0, 1);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

TEST_F(WriteArrays, RefusesMissingArraysAndTooFewNames) {
  const uint8_t block[8] = {};
  const uint8_t* values[2] = {block, block};
  const uint32_t sizes[2] = {8, 8};
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, nullptr, sizes, 1, 1, 0), std::logic_error);
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, values, nullptr, 1, 1, 0), std::logic_error);
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, values, sizes, 2, 1, 0), std::logic_error);
  EXPECT_TRUE(transport->transfers().empty());
}

}  // namespace
