// Packed value arrays: writes of named outputs (one transfer per value, or bursts of up to 16
// steps), repeated samples of named inputs, and the checks that run before anything is sent.
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;

constexpr uint32_t kOut = 16;  // A_out and S_out
const std::string kTooSmall = "The size of the value is not large enough for the signal: ";

class Arrays : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    core = initMoxCore(ref, 16, 14, kOut, kOut);
    ASSERT_NE(core, nullptr);
    for (const auto& [name, type, bits] : {std::tuple{"s3", ZINMOX_SYNC_OUTPUT, s3},
                                           {"s9", ZINMOX_SYNC_OUTPUT, s9},
                                           {"a8", ZINMOX_ASYNC_OUTPUT, a8},
                                           {"x12", ZINMOX_ASYNC_INPUT, x12},
                                           {"y3", ZINMOX_SYNC_INPUT, y3}}) {
      ASSERT_EQ(defineBus(name, type, bits), 0u);
    }
    transport->clearLog();
  }
  void write(const std::vector<std::string>& names, const std::vector<const uint8_t*>& values,
             const std::vector<uint32_t>& sizes, uint32_t valueCount, uint32_t burstMode) {
    core->writeValues(handle, ref, names, values.data(), sizes.data(),
                      static_cast<uint32_t>(names.size()), valueCount, burstMode);
  }
  std::vector<WriteImage> writes() {
    std::vector<WriteImage> images;
    for (const auto& transfer : transport->transfers()) {
      images.push_back(decodeWriteCommand(transfer.text, linePrefix(ref), kOut, kOut));
    }
    return images;
  }
  // Step string of value bit `bit` when values[t] is on step t.
  static std::string stepsOf(const std::vector<uint32_t>& values, uint32_t bit) {
    std::string steps;
    for (uint32_t v : values) steps.push_back(((v >> bit) & 1) ? '1' : '0');
    return steps;
  }
  static std::string marks(std::vector<uint32_t> positions) {
    std::string result(kOut, '0');
    for (uint32_t p : positions) result[p] = '1';
    return result;
  }
  // The packed sample block of one signal: the port characters at the positions.
  static std::vector<uint8_t> blockOf(const std::string& port, const std::vector<uint32_t>& at) {
    std::string bits;
    for (uint32_t p : at) bits.push_back(port[p]);
    return packBits(bits);
  }

  ZinRT::ZinMOX_Core* core = nullptr;
  std::vector<uint32_t> s3{0, 1, 2}, s9{11, 10, 9, 8, 7, 6, 5, 4, 3},
      a8{8, 9, 10, 11, 12, 13, 15, 14}, x12{15, 14, 13, 12, 11, 10, 9, 8, 7, 6, 5, 4}, y3{13, 0, 7};
};

TEST_F(Arrays, BurstOfTwentyValuesGoesOutInTwoTransfers) {
  std::vector<uint32_t> v3, v9;
  std::vector<uint8_t> bytes3, bytes9;
  for (uint32_t k = 0; k < 20; ++k) {
    v3.push_back((k * 3 + 1) & 7);
    v9.push_back((k * 37 + 100) & 0x1FF);
    bytes3.push_back(static_cast<uint8_t>(v3.back()));
    for (uint8_t b : packValue(v9.back(), 2)) bytes9.push_back(b);
  }
  write({"s3", "S9"}, {bytes3.data(), bytes9.data()}, {20, 40}, 20, 1);
  const std::vector<WriteImage> images = writes();
  ASSERT_EQ(images.size(), 2u);
  EXPECT_EQ(transport->flushCount(), 2u);
  for (std::size_t n = 0; n < 2; ++n) {
    SCOPED_TRACE(testing::Message() << "transfer " << n);
    // Values 16 to 19 go out second, value 19 filling steps 4 to 15.
    std::vector<uint32_t> e3(v3.begin() + 16 * n, v3.begin() + std::min<size_t>(20, 16 * n + 16)),
        e9(v9.begin() + 16 * n, v9.begin() + std::min<size_t>(20, 16 * n + 16));
    e3.resize(16, v3[19]);
    e9.resize(16, v9[19]);
    for (uint32_t i = 0; i < 3; ++i) EXPECT_EQ(images[n].steps[s3[i]], stepsOf(e3, i));
    for (uint32_t i = 0; i < 9; ++i) EXPECT_EQ(images[n].steps[s9[i]], stepsOf(e9, i));
    EXPECT_EQ(images[n].syncUpdate, marks({0, 1, 2, 11, 10, 9, 8, 7, 6, 5, 4, 3}));
    EXPECT_EQ(images[n].asyncUpdate, marks({}));
  }
}

TEST_F(Arrays, WithoutBurstModeEachValueIsItsOwnTransfer) {
  const std::vector<uint8_t> values8 = {0x11, 0x82, 0xF3}, values3 = {1, 6, 3};
  write({"a8", "s3"}, {values8.data(), values3.data()}, {3, 3}, 3, 2);  // any mode but 1
  const std::vector<WriteImage> images = writes();
  ASSERT_EQ(images.size(), 3u);
  for (uint32_t k = 0; k < 3; ++k) {
    SCOPED_TRACE(testing::Message() << "transfer " << k);
    // Not one run of ports: staged bit by bit, value bit 7 on port bit 14.
    for (uint32_t i = 0; i < 8; ++i) {
      EXPECT_EQ(images[k].asyncValues[a8[i]], ((values8[k] >> i) & 1) ? '1' : '0') << i;
    }
    for (uint32_t i = 0; i < 3; ++i) {
      EXPECT_EQ(images[k].steps[s3[i]], std::string(16, ((values3[k] >> i) & 1) ? '1' : '0'));
    }
    EXPECT_EQ(images[k].asyncUpdate, marks(a8));
    EXPECT_EQ(images[k].syncUpdate, marks(s3));
  }
}

TEST_F(Arrays, WritesCheckEveryEntryInOrderBeforeSendingAnything) {
  const uint8_t block[64] = {};
  const uint8_t* v = block;
  const auto failure = [&](std::vector<std::string> names, std::vector<const uint8_t*> values,
                           std::vector<uint32_t> sizes, uint32_t count, uint32_t burst) {
    return logicErrorOf([&] { write(names, values, sizes, count, burst); });
  };
  // Within one entry: lookup, burst mode, size, null pointer; the first failing entry decides.
  EXPECT_EQ(failure({"nope"}, {nullptr}, {0}, 2, 1), "Could not find a signal with the name: nope");
  EXPECT_EQ(failure({"x12"}, {v}, {64}, 1, 0), "Could not find a signal with the name: x12");
  EXPECT_EQ(failure({"a8"}, {nullptr}, {0}, 2, 1),
            "Burst mode cannot be used with the non-synchronous output: a8");
  EXPECT_EQ(failure({"s9"}, {nullptr}, {3}, 2, 1), kTooSmall + "s9");
  EXPECT_EQ(failure({"s9"}, {nullptr}, {4}, 2, 1), "Invalid values for signal: s9");
  EXPECT_EQ(failure({"s3", "nope"}, {v, v}, {1, 64}, 2, 0), kTooSmall + "s3");
  EXPECT_EQ(failure({"s3", "a8"}, {v, v}, {2, 64}, 2, 1),
            "Burst mode cannot be used with the non-synchronous output: a8");
  EXPECT_EQ(failure({"s3", "s9"}, {v, nullptr}, {0, 0}, 0, 0), "Invalid values for signal: s9")
      << "the checks run with no values to send";
  write({"s3", "s9"}, {v, v}, {0, 0}, 0, 1);
  // Missing arrays and too few names.
  const uint8_t* values[2] = {block, block};
  const uint32_t sizes[2] = {8, 8};
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, nullptr, sizes, 1, 1, 0), std::logic_error);
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, values, nullptr, 1, 1, 0), std::logic_error);
  EXPECT_THROW(core->writeValues(handle, ref, {"s3"}, values, sizes, 2, 1, 0), std::logic_error);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

TEST_F(Arrays, ThreeSamplesLandOneBlockApart) {
  std::mt19937 rng(33);
  std::vector<InputImage> images;
  for (int k = 0; k < 3; ++k) {
    images.push_back(InputImage::random(16, 14, rng));
    transport->queueReadData(readDataFor(images.back()));
  }
  // x12: value, up, down (2 bytes per sample); y3: all but one sync-activity vector.
  std::vector<std::vector<uint8_t>> x(3, std::vector<uint8_t>(6, 0)),
      y(5, std::vector<uint8_t>(3, 0));
  x[0][1] = 0xF0;  // spare bits of sample 0 that are already set stay set
  uint8_t* values[2] = {x[0].data(), y[0].data()};
  uint8_t* up[2] = {x[1].data(), y[1].data()};
  uint8_t* down[2] = {x[2].data(), y[2].data()};
  uint8_t* syncUp[2] = {nullptr, nullptr};
  uint8_t* syncDown[2] = {nullptr, y[4].data()};
  const uint32_t sizes[2] = {6, 3};
  core->readValues(handle, ref, {"x12", "Y3"}, values, up, down, syncUp, syncDown, sizes, 2, 3);
  EXPECT_EQ(transport->transfers().size(), 3u) << "one read per sample";
  for (int k = 0; k < 3; ++k) {
    SCOPED_TRACE(testing::Message() << "sample " << k);
    const auto expectBlock = [&](const std::vector<uint8_t>& buffer, std::size_t width,
                                 const std::vector<uint8_t>& expected, uint8_t lastByteMask) {
      for (std::size_t b = 0; b < width; ++b) {
        const uint8_t mask = b + 1 == width ? lastByteMask : 0xFF;
        EXPECT_EQ(buffer[k * width + b] & mask, expected[b]) << "byte " << b;
      }
    };
    const auto vectors = images[k].vectors();  // x[v] holds async vector v, y[v] sync vector v
    for (int v : {0, 1, 2}) expectBlock(x[v], 2, blockOf(*vectors[v], x12), 0x0F);
    for (int v : {0, 1, 2, 4}) expectBlock(y[v], 1, blockOf(*vectors[3 + v], y3), 0x07);
  }
  EXPECT_EQ(x[0][1] & 0xF0, 0xF0);
  EXPECT_EQ(y[3], std::vector<uint8_t>(3, 0));

  // A missing vector array is skipped.
  const InputImage image = InputImage::random(16, 14, rng);
  transport->queueReadData(readDataFor(image));
  std::vector<uint8_t> value(2, 0), downOnly(2, 0);
  uint8_t* valueArray[1] = {value.data()};
  uint8_t* downArray[1] = {downOnly.data()};
  core->readValues(handle, ref, {"x12"}, valueArray, nullptr, downArray, nullptr, nullptr, sizes, 1,
                   1);
  EXPECT_EQ(value, blockOf(image.asyncValue, x12));
  EXPECT_EQ(downOnly, blockOf(image.asyncDown, x12));
}

TEST_F(Arrays, ReadsCheckSizesAndNamesBeforeReading) {
  std::vector<uint8_t> buffer(6, 0xEE);
  uint8_t* values[2] = {buffer.data(), buffer.data()};
  uint32_t sizes[2] = {5, 6};
  const auto read = [&](std::vector<std::string> names, uint32_t count, uint32_t n,
                        const uint32_t* s) {
    core->readValues(handle, ref, names, values, nullptr, nullptr, nullptr, nullptr, s, count, n);
  };
  const auto failure = [&](std::vector<std::string> names, uint32_t count, uint32_t samples) {
    return logicErrorOf([&] { read(names, count, samples, sizes); });
  };
  EXPECT_EQ(failure({"x12"}, 1, 3), kTooSmall + "x12");
  EXPECT_EQ(failure({"a8", "x12"}, 2, 3), "Could not find a signal with the name: a8");
  EXPECT_EQ(failure({"x12", "nope"}, 2, 0), "Could not find a signal with the name: nope")
      << "the checks run even for 0 samples";
  sizes[0] = 6;  // enough for three samples of twelve bits
  EXPECT_EQ(failure({"x12", "nope"}, 2, 3), "Could not find a signal with the name: nope");
  EXPECT_THROW(read({"x12"}, 1, 1, nullptr), std::logic_error);
  EXPECT_THROW(read({"x12"}, 2, 1, sizes), std::logic_error);
  read({"x12"}, 1, 0, sizes);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(buffer, std::vector<uint8_t>(6, 0xEE)) << "zero samples: nothing read or written";
  read({"x12"}, 1, 3, sizes);
  EXPECT_EQ(transport->transfers().size(), 3u);
}

}  // namespace
