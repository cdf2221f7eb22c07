// The command texts that reach the transport, and the unpacking of read data into the input
// image, driven through the whole-port calls.
#include <array>
#include <random>
#include <string>
#include <vector>

#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;

class CommandText : public SessionFixture {
 protected:
  // Reads the whole input image of a core through ZinMOX_getPortBits and returns it.
  InputImage readAll(uint32_t asyncIn, uint32_t syncIn) {
    std::vector<std::vector<uint8_t>> async(3, std::vector<uint8_t>((asyncIn + 7) / 8 + 1, 0));
    std::vector<std::vector<uint8_t>> sync(5, std::vector<uint8_t>((syncIn + 7) / 8 + 1, 0));
    EXPECT_EQ(ZinMOX_getPortBits(handle, &ref, async[0].data(), async[1].data(), async[2].data(),
                                 asyncIn, sync[0].data(), sync[1].data(), sync[2].data(),
                                 sync[3].data(), sync[4].data(), syncIn),
              0u);
    InputImage image;
    image.asyncValue = unpackBits(async[0].data(), asyncIn);
    image.asyncUp = unpackBits(async[1].data(), asyncIn);
    image.asyncDown = unpackBits(async[2].data(), asyncIn);
    image.syncValue = unpackBits(sync[0].data(), syncIn);
    image.syncUp = unpackBits(sync[1].data(), syncIn);
    image.syncDown = unpackBits(sync[2].data(), syncIn);
    image.syncSyncUp = unpackBits(sync[3].data(), syncIn);
    image.syncSyncDown = unpackBits(sync[4].data(), syncIn);
    return image;
  }

  static void expectImage(const InputImage& actual, const InputImage& expected) {
    EXPECT_EQ(actual.asyncValue, expected.asyncValue);
    EXPECT_EQ(actual.asyncUp, expected.asyncUp);
    EXPECT_EQ(actual.asyncDown, expected.asyncDown);
    EXPECT_EQ(actual.syncValue, expected.syncValue);
    EXPECT_EQ(actual.syncUp, expected.syncUp);
    EXPECT_EQ(actual.syncDown, expected.syncDown);
    EXPECT_EQ(actual.syncSyncUp, expected.syncSyncUp);
    EXPECT_EQ(actual.syncSyncDown, expected.syncSyncDown);
  }
};

TEST_F(CommandText, WriteOfFourAsynchronousOutputs) {
  initMoxCore(ref, 0, 0, 4, 0);
  const uint8_t data = 0x05, mask = 0x0F;  // values of bits 0..3: 1 0 1 0
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, &data, &mask, 4, nullptr, nullptr, 0), 0u);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_EQ(sent[0].text, "01 2 0 01 0 00000009 AF\n01 2 0 02 0 00000004 0");
  EXPECT_EQ(sent[0].readBitCount, 0u);
  EXPECT_EQ(transport->flushCount(), 1u);
}

TEST_F(CommandText, WriteOfTwoSynchronousOutputs) {
  initMoxCore(ref, 0, 0, 0, 2);
  // Step t: bit 0 is 1 on steps 0..3, bit 1 on the odd steps.
  std::vector<uint8_t> steps(16);
  for (int t = 0; t < 16; ++t) steps[t] = static_cast<uint8_t>((t < 4 ? 1 : 0) | (t % 2 ? 2 : 0));
  const uint8_t mask = 0x03;
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, steps.data(), &mask, 2), 0u);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  // D = "1111000000000000" "0101010101010101" "11": 34 bits, 35 on the wire.
  EXPECT_EQ(sent[0].text, "01 2 0 01 0 00000023 3C0015557\n01 2 0 02 0 00000004 0");
  EXPECT_EQ(transport->flushCount(), 1u);
}

TEST_F(CommandText, ReadOfEightAsynchronousInputs) {
  initMoxCore(ref, 8, 0, 0, 0);
  std::mt19937 rng(11);
  InputImage image = InputImage::random(8, 0, rng);
  transport->queueReadData(readDataFor(image));
  expectImage(readAll(8, 0), image);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_EQ(sent[0].text, "01 2 0 03 1 00000030 0\n01 2 0 04 1 00000004 0");
  EXPECT_EQ(sent[0].readBitCount, 56u);
  EXPECT_EQ(transport->flushCount(), 0u) << "no flush follows a read";
}

TEST_F(CommandText, ReadOfTwoAsynchronousAndTwoSynchronousInputs) {
  initMoxCore(ref, 2, 2, 0, 0);
  std::mt19937 rng(12);
  InputImage image = InputImage::random(2, 2, rng);
  transport->queueReadData(readDataFor(image));
  expectImage(readAll(2, 2), image);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_EQ(sent[0].text, "01 2 0 03 1 00000024 0\n01 2 0 04 1 00000004 0");
  EXPECT_EQ(sent[0].readBitCount, 48u);
}

TEST_F(CommandText, CoreWithAllFourPortsAtAReferenceWithHexDigits) {
  ref = ZIN_CORE_REF{0xAB, 0xF, 0x7};
  initMoxCore(ref, 3, 2, 5, 3);
  const uint8_t asyncData = 0x13, asyncMask = 0x06;
  std::vector<uint8_t> steps(16);
  for (int t = 0; t < 16; ++t) steps[t] = static_cast<uint8_t>(t % 8);
  const uint8_t syncMask = 0x05;
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, &asyncData, &asyncMask, 5, steps.data(), &syncMask, 3),
            0u);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_EQ(sent[0].text, "AB F 7 01 0 0000003E 19555533330F0F65\nAB F 7 02 0 00000004 0");

  WriteImage image = decodeWriteCommand(sent[0].text, "AB F 7 ", 5, 3);
  EXPECT_EQ(image.asyncValues, "11001");
  EXPECT_EQ(image.asyncUpdate, "01100");
  EXPECT_EQ(image.syncUpdate, "101");
  ASSERT_EQ(image.steps.size(), 3u);
  EXPECT_EQ(image.steps[0], "0101010101010101");
  EXPECT_EQ(image.steps[1], "0011001100110011");
  EXPECT_EQ(image.steps[2], "0000111100001111");

  std::mt19937 rng(13);
  InputImage input = InputImage::random(3, 2, rng);
  transport->clearLog();
  transport->queueReadData(readDataFor(input));
  expectImage(readAll(3, 2), input);
  sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  EXPECT_EQ(sent[0].text, "AB F 7 03 1 00000028 0\nAB F 7 04 1 00000004 0");
  EXPECT_EQ(sent[0].readBitCount, 48u);
}

TEST_F(CommandText, ReadBitCountsRoundEachLineToWholeBytes) {
  // L = 4*A_in + 6*S_in + 16 bits on the first line, rounded up to bytes, plus 8 for the second.
  const std::vector<std::array<uint32_t, 3>> cases = {
      {1, 0, 32}, {0, 1, 32}, {2, 0, 32}, {1, 1, 40}, {0, 3, 48}, {16, 0, 88}, {5, 7, 88}};
  uint32_t coreIndex = 0;
  for (const auto& c : cases) {
    ZIN_CORE_REF at{9, 3, coreIndex++};
    SCOPED_TRACE(testing::Message() << "A_in " << c[0] << ", S_in " << c[1]);
    initMoxCore(at, c[0], c[1], 0, 0);
    ref = at;
    ASSERT_EQ(ZinMOX_getPortBits(handle, &at, nullptr, nullptr, nullptr, 0, nullptr, nullptr,
                                 nullptr, nullptr, nullptr, 0),
              0u);
    auto sent = transport->transfers();
    ASSERT_EQ(sent.size(), 1u);
    EXPECT_EQ(sent[0].readBitCount, c[2]);
    EXPECT_EQ(sent[0].text, readCommandText(linePrefix(at), c[0], c[1]));
  }
}

TEST_F(CommandText, UnpacksCoresWithInputsOfOneKindOnly) {
  std::mt19937 rng(14);
  // Only synchronous inputs.
  initMoxCore(ref, 0, 9, 0, 0);
  InputImage syncOnly = InputImage::random(0, 9, rng);
  transport->queueReadData(readDataFor(syncOnly));
  expectImage(readAll(0, 9), syncOnly);
  // Only asynchronous inputs.
  ZIN_CORE_REF other{1, 2, 1};
  initMoxCore(other, 13, 0, 0, 0);
  ref = other;
  InputImage asyncOnly = InputImage::random(13, 0, rng);
  transport->queueReadData(readDataFor(asyncOnly));
  expectImage(readAll(13, 0), asyncOnly);
  // Both kinds, several reads: each read replaces the whole image.
  ZIN_CORE_REF both{1, 2, 2};
  initMoxCore(both, 7, 5, 0, 0);
  ref = both;
  for (int round = 0; round < 3; ++round) {
    InputImage image = InputImage::random(7, 5, rng);
    transport->queueReadData(readDataFor(image));
    expectImage(readAll(7, 5), image);
  }
}

TEST_F(CommandText, CoreWithoutOutputsSendsNothingAndDoesNotFlush) {
  initMoxCore(ref, 4, 4, 0, 0);
  EXPECT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  ZinRT::ZinMOX_ValueMap empty;
  uintptr_t word = mapWord(empty);
  EXPECT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

TEST_F(CommandText, CoreWithoutInputsSendsNoRead) {
  initMoxCore(ref, 0, 0, 4, 4);
  EXPECT_EQ(ZinMOX_getPortBits(handle, &ref, nullptr, nullptr, nullptr, 0, nullptr, nullptr,
                               nullptr, nullptr, nullptr, 0),
            0u);
  ZinRT::ZinMOX_ValueMap map{{"kept", "1"}};
  uintptr_t word = mapWord(map);
  EXPECT_EQ(ZinMOX_readValues(handle, &ref, &word), 0u);
  EXPECT_EQ(map, (ZinRT::ZinMOX_ValueMap{{"kept", "1"}}));
  EXPECT_TRUE(transport->transfers().empty());
  expectNoMessages();
}

TEST_F(CommandText, OutputImagePersistsAndUpdateMarksFollowEachWrite) {
  initMoxCore(ref, 0, 0, 6, 2);
  const uint8_t asyncData = 0x2D, asyncMask = 0x3F;  // 101101 from bit 0: "101101"
  std::vector<uint8_t> steps(16, 0x02);              // sync bit 1 high on every step
  const uint8_t syncMask = 0x02;
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, &asyncData, &asyncMask, 6, steps.data(), &syncMask, 2),
            0u);
  // Both counts 0: the same values are sent again, with no update mark.
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  // Only the asynchronous port: the synchronous update marks are cleared.
  const uint8_t asyncData2 = 0x01, asyncMask2 = 0x01;
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, &asyncData2, &asyncMask2, 6, nullptr, nullptr, 0), 0u);

  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 3u);
  EXPECT_EQ(transport->flushCount(), 3u);
  const std::string prefix = linePrefix(ref);
  WriteImage first = decodeWriteCommand(sent[0].text, prefix, 6, 2);
  EXPECT_EQ(first.asyncValues, "101101");
  EXPECT_EQ(first.asyncUpdate, "111111");
  EXPECT_EQ(first.steps, (std::vector<std::string>{std::string(16, '0'), std::string(16, '1')}));
  EXPECT_EQ(first.syncUpdate, "01");

  WriteImage second = decodeWriteCommand(sent[1].text, prefix, 6, 2);
  EXPECT_EQ(second.asyncValues, "101101");
  EXPECT_EQ(second.steps, first.steps);
  EXPECT_EQ(second.asyncUpdate, "000000");
  EXPECT_EQ(second.syncUpdate, "00");

  WriteImage third = decodeWriteCommand(sent[2].text, prefix, 6, 2);
  EXPECT_EQ(third.asyncValues, "100000");
  EXPECT_EQ(third.asyncUpdate, "100000");
  EXPECT_EQ(third.steps, first.steps);
  EXPECT_EQ(third.syncUpdate, "00");
}

}  // namespace
