// Whole-port writes and reads: the command texts that reach the transport, the unpacking of read
// data, the count and pointer checks of the exported calls, and the packing of values, masks and
// step vectors.
#include <array>
#include <random>
#include <string>
#include <vector>

#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;

class Ports : public SessionFixture {
 protected:
  uint32_t set(const uint8_t* asyncData, const uint8_t* asyncMask, uint32_t asyncCount,
               const uint8_t* syncData, const uint8_t* syncMask, uint32_t syncCount) {
    return ZinMOX_setPortBits(handle, &ref, asyncData, asyncMask, asyncCount, syncData, syncMask,
                              syncCount);
  }
  // Reads into eight vectors `v` of `bytes` bytes, filled with 0xEE first; `skip` leaves that
  // pointer null.
  uint32_t get(std::vector<std::vector<uint8_t>>& v, uint32_t asyncCount, uint32_t syncCount,
               int skip = -1, std::size_t bytes = 2) {
    v.assign(8, std::vector<uint8_t>(bytes, 0xEE));
    std::array<uint8_t*, 8> p{};
    for (int k = 0; k < 8; ++k) p[k] = k == skip ? nullptr : v[k].data();
    return ZinMOX_getPortBits(handle, &ref, p[0], p[1], p[2], asyncCount, p[3], p[4], p[5], p[6],
                              p[7], syncCount);
  }
  // Reads the whole input image through ZinMOX_getPortBits.
  InputImage readAll(uint32_t asyncIn, uint32_t syncIn) {
    std::vector<std::vector<uint8_t>> v;
    EXPECT_EQ(get(v, asyncIn, syncIn, -1, (asyncIn + syncIn) / 8 + 1), 0u);
    InputImage image = InputImage::zeros(asyncIn, syncIn);
    const auto fields = image.vectors();
    for (std::size_t k = 0; k < 8; ++k) {
      const_cast<std::string&>(*fields[k]) = unpackBits(v[k].data(), k < 3 ? asyncIn : syncIn);
    }
    return image;
  }
  static void expectImage(const InputImage& actual, const InputImage& expected) {
    for (std::size_t k = 0; k < 8; ++k) EXPECT_EQ(*actual.vectors()[k], *expected.vectors()[k]);
  }
};

TEST_F(Ports, WriteTextsCarryValuesStepsAndMarksInOrder) {
  struct Case {
    ZIN_CORE_REF at;
    uint32_t asyncOut, syncOut;
    uint8_t asyncData, asyncMask, syncMask;
    uint8_t (*step)(int t);
    const char* text;
  };
  // clang-format off
  const std::vector<Case> cases = {
      // Values of bits 0..3: 1 0 1 0, all marked: D = "1010" "1111".
      {{1, 2, 0}, 4, 0, 0x05, 0x0F, 0, nullptr, "01 2 0 01 0 00000009 AF\n01 2 0 02 0 00000004 0"},
      // Bit 0 is 1 on steps 0..3, bit 1 on the odd steps: D = "1111000000000000"
      // "0101010101010101" "11": 34 bits, 35 on the wire.
      {{1, 2, 0}, 0, 2, 0, 0, 0x03,
       [](int t) { return static_cast<uint8_t>((t < 4 ? 1 : 0) | (t % 2 ? 2 : 0)); },
       "01 2 0 01 0 00000023 3C0015557\n01 2 0 02 0 00000004 0"},
      // All ports, at a reference with hexadecimal digits.
      {{0xAB, 0xF, 0x7}, 5, 3, 0x13, 0x06, 0x05, [](int t) { return static_cast<uint8_t>(t % 8); },
       "AB F 7 01 0 0000003E 19555533330F0F65\nAB F 7 02 0 00000004 0"},
  };
  // clang-format on
  for (const Case& c : cases) {
    SCOPED_TRACE(c.text);
    ref = c.at;
    initMoxCore(ref, 0, 0, c.asyncOut, c.syncOut);
    std::vector<uint8_t> steps(16);
    for (int t = 0; t < 16 && c.step != nullptr; ++t) steps[t] = c.step(t);
    ASSERT_EQ(set(&c.asyncData, &c.asyncMask, c.asyncOut, steps.data(), &c.syncMask, c.syncOut),
              0u);
    const auto sent = transport->transfers();
    ASSERT_EQ(sent.size(), 1u);
    EXPECT_EQ(sent[0].text, c.text);
    EXPECT_EQ(sent[0].readBitCount, 0u);
    EXPECT_EQ(transport->flushCount(), 1u) << "a flush follows each write";
  }
}

TEST_F(Ports, ReadTextsRoundEachLineToWholeBytesAndTheDataUnpacks) {
  struct Case {
    uint32_t asyncIn, syncIn, readBits;
    const char* text;  // null: the text is checked against the second implementation
  };
  // L = 4*A_in + 6*S_in + 16 bits on the first line, rounded up to bytes, plus 8 for the second.
  // clang-format off
  const std::vector<Case> cases = {
      {8, 0, 56, "01 2 0 03 1 00000030 0\n01 2 0 04 1 00000004 0"},
      {2, 2, 48, "01 2 0 03 1 00000024 0\n01 2 0 04 1 00000004 0"},
      {3, 2, 48, "01 2 0 03 1 00000028 0\n01 2 0 04 1 00000004 0"},
      {1, 0, 32, nullptr}, {0, 1, 32, nullptr}, {2, 0, 32, nullptr}, {1, 1, 40, nullptr},
      {0, 3, 48, nullptr}, {16, 0, 88, nullptr}, {5, 7, 88, nullptr}, {0, 9, 80, nullptr},
      {13, 0, 80, nullptr}};
  // clang-format on
  std::mt19937 rng(11);
  for (const Case& c : cases) {
    SCOPED_TRACE(testing::Message() << "A_in " << c.asyncIn << ", S_in " << c.syncIn);
    initMoxCore(ref, c.asyncIn, c.syncIn, 0, 0);
    for (int round = 0; round < 2; ++round) {  // each read replaces the whole image
      const InputImage image = InputImage::random(c.asyncIn, c.syncIn, rng);
      transport->queueReadData(readDataFor(image));
      expectImage(readAll(c.asyncIn, c.syncIn), image);
    }
    const auto sent = transport->transfers();
    ASSERT_EQ(sent.size(), 2u);
    EXPECT_EQ(sent[0].readBitCount, c.readBits);
    EXPECT_EQ(sent[0].text,
              c.text != nullptr ? c.text : readCommandText(linePrefix(ref), c.asyncIn, c.syncIn));
    EXPECT_EQ(transport->flushCount(), 0u) << "no flush follows a read";
  }
}

TEST_F(Ports, PortsOfWidthZeroSendNothing) {
  initMoxCore(ref, 4, 4, 0, 0);
  EXPECT_EQ(set(nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  ZinRT::ZinMOX_ValueMap map;
  uintptr_t word = mapWord(map);
  EXPECT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
  ref.coreIndex = 1;
  initMoxCore(ref, 0, 0, 4, 4);
  EXPECT_EQ(ZinMOX_getPortBits(handle, &ref, nullptr, nullptr, nullptr, 0, nullptr, nullptr,
                               nullptr, nullptr, nullptr, 0),
            0u);
  map = {{"kept", "1"}};
  EXPECT_EQ(ZinMOX_readValues(handle, &ref, &word), 0u);
  EXPECT_EQ(map, (ZinRT::ZinMOX_ValueMap{{"kept", "1"}}));
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

TEST_F(Ports, OutputImagePersistsAndUpdateMarksFollowEachWrite) {
  initMoxCore(ref, 0, 0, 6, 2);
  const uint8_t asyncData = 0x2D, asyncMask = 0x3F;  // "101101" from bit 0
  std::vector<uint8_t> steps(16, 0x02);              // sync bit 1 high on every step
  const uint8_t syncMask = 0x02, asyncData2 = 0x01, asyncMask2 = 0x01;
  ASSERT_EQ(set(&asyncData, &asyncMask, 6, steps.data(), &syncMask, 2), 0u);
  const WriteImage first = lastWrite(6, 2);
  EXPECT_EQ(first.asyncValues, "101101");
  EXPECT_EQ(first.asyncUpdate, "111111");
  EXPECT_EQ(first.steps, (std::vector<std::string>{std::string(16, '0'), std::string(16, '1')}));
  EXPECT_EQ(first.syncUpdate, "01");
  // Both counts 0: the same values again, with no update mark.
  ASSERT_EQ(set(nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  WriteImage expected = first;
  expected.asyncUpdate = "000000";
  expected.syncUpdate = "00";
  EXPECT_EQ(writeDataHex(lastWrite(6, 2)), writeDataHex(expected));
  // Only the asynchronous port: the synchronous marks are cleared.
  ASSERT_EQ(set(&asyncData2, &asyncMask2, 6, nullptr, nullptr, 0), 0u);
  expected.asyncValues = expected.asyncUpdate = "100000";
  EXPECT_EQ(writeDataHex(lastWrite(6, 2)), writeDataHex(expected));
  EXPECT_EQ(transport->flushCount(), 3u);
}

// A_in 10, S_in 3, A_out 12, S_out 10: two bytes per vector on three of the ports.
constexpr uint32_t kAsyncIn = 10, kSyncIn = 3, kAsyncOut = 12, kSyncOut = 10;

std::string countMessage(const std::string& call, const char* count, const char* type) {
  return call + "() arg. failed:(" + count +
         " == core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_" + type +
         ")) || (" + count + " == 0)";
}

class PortBits : public Ports {
 protected:
  void SetUp() override {
    Ports::SetUp();
    initMoxCore(ref, kAsyncIn, kSyncIn, kAsyncOut, kSyncOut);
  }
};

TEST_F(PortBits, CountAndPointerChecksRunInOrderAndSendNothing) {
  const std::string setCall = "ZinMOX_setPortBits", getCall = "ZinMOX_getPortBits";
  const std::string asyncOut = countMessage(setCall, "asyncOutDataBitCount", "ASYNC_OUTPUT"),
                    syncOut = countMessage(setCall, "syncOutDataBitCount", "SYNC_OUTPUT");
  std::vector<uint8_t> any(64, 0);
  const uint8_t* p = any.data();
  EXPECT_EQ(errorOf(set(p, p, kAsyncOut - 1, p, p, kSyncOut)), asyncOut);
  EXPECT_EQ(errorOf(set(p, p, kAsyncOut + 1, p, p, 999)), asyncOut);
  EXPECT_EQ(errorOf(set(p, p, kAsyncOut, p, p, kSyncOut - 1)), syncOut);
  EXPECT_EQ(errorOf(set(p, p, 0, p, p, kSyncOut + 1)), syncOut);
  EXPECT_EQ(errorOf(set(nullptr, nullptr, kAsyncOut, p, p, kSyncOut + 1)), syncOut)
      << "both counts are checked before the pointers";
  const std::string asyncIn = countMessage(getCall, "asyncInDataBitCount", "ASYNC_INPUT"),
                    syncIn = countMessage(getCall, "syncInDataBitCount", "SYNC_INPUT");
  std::vector<std::vector<uint8_t>> v;
  EXPECT_EQ(errorOf(get(v, kAsyncIn - 1, kSyncIn)), asyncIn);
  EXPECT_EQ(errorOf(get(v, kAsyncIn + 1, 999)), asyncIn);
  EXPECT_EQ(errorOf(get(v, kAsyncIn, kSyncIn + 1)), syncIn);
  EXPECT_EQ(errorOf(get(v, 0, kSyncIn - 1)), syncIn);
  EXPECT_EQ(v[0][0], 0xEE);
  EXPECT_TRUE(transport->transfers().empty());

  // Null vectors of a written port; the failed calls stage nothing.
  const std::vector<uint8_t> first = packValue(0x0A5, 2), other = packValue(0xF00, 2),
                             ones(32, 0xFF);
  ASSERT_EQ(set(first.data(), ones.data(), kAsyncOut, nullptr, nullptr, 0), 0u);
  const uint8_t *o = other.data(), *m = ones.data();
  const std::string null = "ZinMOX_setPortBits() arg. failed:";
  EXPECT_EQ(errorOf(set(nullptr, m, kAsyncOut, m, m, kSyncOut)), null + "asyncOutData!=0");
  EXPECT_EQ(errorOf(set(o, nullptr, kAsyncOut, m, m, kSyncOut)), null + "asyncOutUpdateMask!=0");
  EXPECT_EQ(errorOf(set(o, m, kAsyncOut, nullptr, m, kSyncOut)), null + "syncOutData!=0");
  EXPECT_EQ(errorOf(set(o, m, kAsyncOut, m, nullptr, kSyncOut)), null + "syncOutUpdateMask!=0");
  EXPECT_EQ(transport->transfers().size(), 1u) << "failed calls send nothing";
  ASSERT_EQ(set(nullptr, nullptr, 0, nullptr, nullptr, 0), 0u) << "null vectors of unused ports";
  WriteImage expected = WriteImage::zeros(kAsyncOut, kSyncOut);
  expected.asyncValues = unpackBits(first.data(), kAsyncOut);
  EXPECT_EQ(writeDataHex(lastWrite(kAsyncOut, kSyncOut)), writeDataHex(expected));
  expectNoMessages();
}

TEST_F(PortBits, ReadFillsTheVectorsAskedFor) {
  std::mt19937 rng(21);
  const std::vector<uint8_t> untouched(2, 0xEE);
  // (async count, sync count, vector left null)
  const std::vector<std::array<int, 3>> cases = {{kAsyncIn, kSyncIn, -1}, {kAsyncIn, kSyncIn, 1},
                                                 {kAsyncIn, kSyncIn, 6},  {0, kSyncIn, -1},
                                                 {kAsyncIn, 0, -1},       {0, 0, -1}};
  for (const auto& [asyncCount, syncCount, skip] : cases) {
    SCOPED_TRACE(testing::Message() << asyncCount << "/" << syncCount << " skip " << skip);
    const InputImage image = InputImage::random(kAsyncIn, kSyncIn, rng);
    transport->queueReadData(readDataFor(image));
    std::vector<std::vector<uint8_t>> v;
    ASSERT_EQ(get(v, asyncCount, syncCount, skip), 0u);
    for (int k = 0; k < 8; ++k) {
      const uint32_t count = k < 3 ? asyncCount : syncCount;
      if (k == skip || count == 0) {
        EXPECT_EQ(v[k], untouched) << k;
      } else {
        EXPECT_EQ(unpackBits(v[k].data(), count), *image.vectors()[k]) << k;
      }
    }
  }
  EXPECT_EQ(transport->transfers().size(), cases.size()) << "the read happens with counts of 0";
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

TEST_F(Ports, WidestPortsRoundTripBitExactly) {
  constexpr uint32_t asyncIn = 65535, syncIn = 1001, asyncOut = 65535, syncOut = 4099;
  initMoxCore(ref, asyncIn, syncIn, asyncOut, syncOut);
  std::mt19937 rng(41);
  auto randomBytes = [&](std::size_t n) {
    std::vector<uint8_t> v(n);
    for (uint8_t& b : v) b = static_cast<uint8_t>(rng());
    return v;
  };
  const std::size_t syncBytes = (syncOut + 7) / 8;
  const std::vector<uint8_t> asyncData = randomBytes((asyncOut + 7) / 8),
                             asyncMask = randomBytes((asyncOut + 7) / 8),
                             steps = randomBytes(16 * syncBytes), syncMask = randomBytes(syncBytes);
  ASSERT_EQ(
      set(asyncData.data(), asyncMask.data(), asyncOut, steps.data(), syncMask.data(), syncOut),
      0u);
  const WriteImage image = lastWrite(asyncOut, syncOut);
  EXPECT_EQ(image.asyncValues, unpackBits(asyncData.data(), asyncOut));
  EXPECT_EQ(image.asyncUpdate, unpackBits(asyncMask.data(), asyncOut));
  EXPECT_EQ(image.syncUpdate, unpackBits(syncMask.data(), syncOut));
  for (uint32_t i = 0; i < syncOut; i += 97) {
    std::string expected;
    for (uint32_t t = 0; t < 16; ++t) expected += unpackBits(&steps[t * syncBytes], syncOut)[i];
    EXPECT_EQ(image.steps[i], expected) << "synchronous output bit " << i;
  }
  const InputImage input = InputImage::random(asyncIn, syncIn, rng);
  transport->queueReadData(readDataFor(input));
  expectImage(readAll(asyncIn, syncIn), input);
  expectNoMessages();
}

}  // namespace
