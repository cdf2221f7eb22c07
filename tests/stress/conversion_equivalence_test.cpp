// The word-at-a-time conversions and the direct command-text and read-data paths against plain
// bit-by-bit references, on random data and widths that are not multiples of 4 or 8.
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_NumberUtil.h"
#include "ZinTestKit/ScriptedTransport.h"
#include "support/WireFormat.h"

namespace {

using ZinRT::Zin_NumberUtil;
using ZinTest::bitsToHex;
using ZinTest::unpackBits;

std::vector<uint8_t> randomBytes(std::mt19937& rng, size_t n) {
  std::vector<uint8_t> bytes(n);
  for (uint8_t& b : bytes) b = static_cast<uint8_t>(rng());
  return bytes;
}

std::string reversed(const std::string& text) {
  return std::string(text.rbegin(), text.rend());
}

std::string lowerCase(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

std::string invalidArgumentOf(void (*call)()) {
  try {
    call();
  } catch (const std::invalid_argument& error) {
    return error.what();
  }
  return "no exception";
}

TEST(ConversionEquivalence, FrameworkConversionsMatchBitByBitReferences) {
  std::mt19937 rng(2024);
  std::string out;
  for (int round = 0; round < 300; ++round) {
    const auto n = static_cast<uint32_t>(rng() % 200);
    const std::vector<uint8_t> bytes = randomBytes(rng, n / 8 + 2);
    const std::string reverse = unpackBits(bytes.data(), n);  // character i is bit i
    const std::string msbFirst = reversed(reverse), hex = bitsToHex(msbFirst);
    EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(msbFirst, out), hex) << n;
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(hex.c_str(), n, out), msbFirst);
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(lowerCase(hex).c_str(), n, out), msbFirst);
    EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(bytes.data(), n, out), reverse);
    std::vector<uint8_t> packed((n + 7) / 8 + 1, 0xEE);
    Zin_NumberUtil::reverseBinStr2Bin(reverse, packed.data());
    ASSERT_EQ(unpackBits(packed.data(), n), reverse) << n;
    ASSERT_EQ(packed.back(), 0xEE) << "wrote past ceil(n/8) bytes, n = " << n;

    const ZinRT::Zin_ByteBuffer buffer(bytes.data(), static_cast<uint32_t>(bytes.size()));
    const auto start = static_cast<uint32_t>(rng() % 3);
    std::unique_ptr<ZinRT::Zin_ByteBuffer> text(buffer.bin2HexString(start, n));
    std::vector<uint8_t> tail(bytes.begin() + start, bytes.end());
    tail.resize(n / 8 + 1, 0);  // bits past the buffer read as 0
    EXPECT_EQ(std::string(text->ptr()), bitsToHex(reversed(unpackBits(tail.data(), n))));
    if (hex.empty()) continue;
    const std::string lower = lowerCase(hex);
    const ZinRT::Zin_ByteBuffer digits(reinterpret_cast<const unsigned char*>(lower.data()),
                                       static_cast<uint32_t>(lower.size()));
    std::unique_ptr<ZinRT::Zin_ByteBuffer> back(
        digits.hex2Bin(0, static_cast<uint32_t>(hex.size() - 1)));
    ASSERT_EQ(unpackBits(back->uPtr(), n), reverse);
  }
  // Bad characters are reported by the character met first.
  EXPECT_NE(invalidArgumentOf([] {
              std::string s;
              Zin_NumberUtil::binStr2HexStr("0101010101x10101y1", s);
            }).find("(code 120)"),
            std::string::npos);
  EXPECT_NE(invalidArgumentOf([] {
              std::string s;
              Zin_NumberUtil::hexStr2BinStr("x0G", 4, s);
            }).find("(character code 71)"),
            std::string::npos);
}

// Whole-port writes and reads on cores of random widths: the write data of the command text
// and the unpacked input vectors against the layouts, bit by bit.
TEST(ConversionEquivalence, PortWritesAndReadsMatchTheLayouts) {
  std::mt19937 rng(77);
  for (int round = 0; round < 60; ++round) {
    auto transport = std::make_shared<ZinTestKit::ScriptedTransport>();
    ZinTestKit::MoxStatus status;
    const uint32_t aIn = status.asyncInputCount = rng() % 70;
    const uint32_t sIn = status.syncInputCount = rng() % 70;
    const uint32_t aOut = status.asyncOutputCount = rng() % 70;
    const uint32_t sOut = status.syncOutputCount = 1 + rng() % 70;
    ZIN_CORE_REF ref{1, 2, 0};
    transport->placeMoxCore(ref, status);
    const uint32_t handle = ZinJtag_openSession(transport);
    ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);

    const size_t stepBytes = (sOut + 7) / 8;
    const auto asyncData = randomBytes(rng, (aOut + 7) / 8 + 1);
    const auto asyncMask = randomBytes(rng, (aOut + 7) / 8 + 1);
    const auto syncData = randomBytes(rng, 16 * stepBytes);
    const auto syncMask = randomBytes(rng, stepBytes);
    ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, asyncData.data(), asyncMask.data(), aOut,
                                 syncData.data(), syncMask.data(), sOut),
              0u);
    ZinTest::WriteImage image = ZinTest::WriteImage::zeros(aOut, sOut);
    image.asyncValues = unpackBits(asyncData.data(), aOut);
    image.asyncUpdate = unpackBits(asyncMask.data(), aOut);
    image.syncUpdate = unpackBits(syncMask.data(), sOut);
    for (size_t t = 0; t < 16; ++t) {
      const std::string step = unpackBits(&syncData[t * stepBytes], sOut);
      for (uint32_t i = 0; i < sOut; ++i) image.steps[i][t] = step[i];
    }
    const std::string text = transport->transfers().at(0).text;
    const std::string firstLine = text.substr(0, text.find('\n'));
    EXPECT_EQ(firstLine.substr(firstLine.rfind(' ') + 1), ZinTest::writeDataHex(image))
        << aOut << "/" << sOut;

    // Character j of the read bit text is bit n-1-j of the data.
    const uint32_t n = 4 * aIn + 6 * sIn;
    const auto readData = randomBytes(rng, (n + 16 + 7) / 8 + 1);
    transport->queueReadData(readData);
    std::vector<std::vector<uint8_t>> got(8,
                                          std::vector<uint8_t>((std::max(aIn, sIn) + 7) / 8 + 1));
    ASSERT_EQ(ZinMOX_getPortBits(handle, &ref, got[0].data(), got[1].data(), got[2].data(), aIn,
                                 got[3].data(), got[4].data(), got[5].data(), got[6].data(),
                                 got[7].data(), sIn),
              0u);
    const std::string bits = reversed(unpackBits(readData.data(), n));
    for (uint32_t i = 0; i < aIn; ++i) {
      for (int k = 0; k < 3; ++k) ASSERT_EQ(unpackBits(got[k].data(), aIn)[i], bits[4 * i + k]);
    }
    for (uint32_t i = 0; i < sIn; ++i) {
      for (int k = 0; k < 5; ++k) {
        ASSERT_EQ(unpackBits(got[3 + k].data(), sIn)[i], bits[4 * aIn + 6 * i + k]);
      }
    }
    ZinJtag_closeSession(handle);
  }
}

}  // namespace
