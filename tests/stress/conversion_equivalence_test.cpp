// The word-at-a-time conversions and the direct command-text and read-data paths against plain
// bit-by-bit references, on random data and widths that are not multiples of 4 or 8.
#include <gtest/gtest.h>

#include <cstdint>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinMOX/ZinMOX_Core.h"
#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_CoreList.h"
#include "ZinRT/Zin_NumberUtil.h"
#include "ZinTarget/ScriptedTransport.h"

namespace {

using ZinRT::Zin_NumberUtil;

constexpr char kDigits[] = "0123456789ABCDEF";

int bitOf(const std::vector<uint8_t>& bytes, size_t i) {
  return i / 8 < bytes.size() ? (bytes[i / 8] >> (i % 8)) & 1 : 0;
}

std::vector<uint8_t> randomBytes(std::mt19937& rng, size_t n) {
  std::vector<uint8_t> bytes(n);
  for (uint8_t& b : bytes) b = static_cast<uint8_t>(rng());
  return bytes;
}

// The hexadecimal text of a bit text, most significant first, padded on the left.
std::string referenceHex(const std::string& bits) {
  const std::string padded(std::string((4 - bits.size() % 4) % 4, '0') + bits);
  std::string hex;
  for (size_t d = 0; d < padded.size(); d += 4) {
    int v = 0;
    for (size_t j = 0; j < 4; ++j) v = 2 * v + (padded[d + j] == '1');
    hex += kDigits[v];
  }
  return hex;
}

TEST(ConversionEquivalence, FrameworkConversionsMatchBitByBitReferences) {
  std::mt19937 rng(2024);
  std::string out;
  for (int round = 0; round < 300; ++round) {
    const size_t n = rng() % 200;
    const std::vector<uint8_t> bytes = randomBytes(rng, n / 8 + 2);
    std::string reverse;  // character i is bit i
    for (size_t i = 0; i < n; ++i) reverse += bitOf(bytes, i) != 0 ? '1' : '0';
    const std::string msbFirst(reverse.rbegin(), reverse.rend());

    EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(msbFirst, out), referenceHex(msbFirst)) << n;
    const std::string hex = referenceHex(msbFirst);
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(hex.c_str(), static_cast<uint32_t>(n), out), msbFirst);
    EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(bytes.data(), static_cast<uint32_t>(n), out),
              reverse);
    std::vector<uint8_t> packed(n / 8 + 1, 0xEE);
    Zin_NumberUtil::reverseBinStr2Bin(reverse, packed.data());
    for (size_t i = 0; i < n; ++i)
      ASSERT_EQ(bitOf(packed, i), bitOf(bytes, i)) << n << " bit " << i;

    const ZinRT::Zin_ByteBuffer buffer(bytes.data(), static_cast<uint32_t>(bytes.size()));
    const uint32_t start = static_cast<uint32_t>(rng() % 3);
    std::unique_ptr<ZinRT::Zin_ByteBuffer> text(
        buffer.bin2HexString(start, static_cast<uint32_t>(n)));
    std::string expected;
    for (size_t i = 0; i < n; ++i) expected += bitOf(bytes, 8 * start + i) != 0 ? '1' : '0';
    EXPECT_EQ(std::string(text->ptr()),
              referenceHex(std::string(expected.rbegin(), expected.rend())));
    if (!hex.empty()) {
      const ZinRT::Zin_ByteBuffer digits(reinterpret_cast<const unsigned char*>(hex.data()),
                                         static_cast<uint32_t>(hex.size()));
      std::unique_ptr<ZinRT::Zin_ByteBuffer> back(
          digits.hex2Bin(0, static_cast<uint32_t>(hex.size() - 1)));
      for (size_t i = 0; i < n; ++i)
        ASSERT_EQ(bitOf({back->uPtr(), back->uPtr() + back->getSize()}, i), bitOf(bytes, i));
    }
  }
  // Bad characters are reported by the character met first, as before.
  try {
    Zin_NumberUtil::binStr2HexStr("0101010101x10101y1", out);
    ADD_FAILURE() << "no exception";
  } catch (const std::invalid_argument& error) {
    EXPECT_NE(std::string(error.what()).find("(code 120)"), std::string::npos) << error.what();
  }
  try {
    Zin_NumberUtil::hexStr2BinStr("x0G", 4, out);
    ADD_FAILURE() << "no exception";
  } catch (const std::invalid_argument& error) {
    EXPECT_NE(std::string(error.what()).find("(character code 71)"), std::string::npos)
        << error.what();
  }
}

// Whole-port writes and reads on cores of random widths: the write data of the command text
// and the input image against the layouts computed bit by bit.
TEST(ConversionEquivalence, PortWritesAndReadsMatchTheLayouts) {
  std::mt19937 rng(77);
  for (int round = 0; round < 60; ++round) {
    auto transport = std::make_shared<ZinTarget::ScriptedTransport>();
    ZinTarget::MoxStatus status;
    status.asyncInputCount = rng() % 70;
    status.syncInputCount = rng() % 70;
    status.asyncOutputCount = rng() % 70;
    status.syncOutputCount = 1 + rng() % 70;
    ZIN_CORE_REF ref{1, 2, 0};
    transport->placeMoxCore(ref, status);
    const uint32_t handle = ZinJtag_openSession(transport);
    ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
    const uint32_t aOut = status.asyncOutputCount, sOut = status.syncOutputCount;
    const uint32_t aIn = status.asyncInputCount, sIn = status.syncInputCount;

    const size_t stepBytes = (sOut + 7) / 8;
    const auto asyncData = randomBytes(rng, (aOut + 7) / 8 + 1);
    const auto asyncMask = randomBytes(rng, (aOut + 7) / 8 + 1);
    const auto syncData = randomBytes(rng, 16 * stepBytes);
    const auto syncMask = randomBytes(rng, stepBytes);
    transport->clearLog();
    ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, asyncData.data(), asyncMask.data(), aOut,
                                 syncData.data(), syncMask.data(), sOut),
              0u);
    std::string d;
    for (uint32_t i = 0; i < aOut; ++i) d += bitOf(asyncData, i) ? '1' : '0';
    for (uint32_t i = 0; i < sOut; ++i) {
      for (size_t t = 0; t < 16; ++t) d += bitOf(syncData, 8 * stepBytes * t + i) ? '1' : '0';
    }
    for (uint32_t i = 0; i < aOut; ++i) d += bitOf(asyncMask, i) ? '1' : '0';
    for (uint32_t i = 0; i < sOut; ++i) d += bitOf(syncMask, i) ? '1' : '0';
    const std::string text = transport->transfers().at(0).text;
    const std::string firstLine = text.substr(0, text.find('\n'));
    EXPECT_EQ(firstLine.substr(firstLine.rfind(' ') + 1), referenceHex(d)) << aOut << "/" << sOut;

    const uint32_t n = 4 * aIn + 6 * sIn;
    const auto readData = randomBytes(rng, (n + 16 + 7) / 8 + 1);
    transport->queueReadData(readData);
    std::vector<std::vector<uint8_t>> got(8,
                                          std::vector<uint8_t>((std::max(aIn, sIn) + 7) / 8 + 1));
    ASSERT_EQ(ZinMOX_getPortBits(handle, &ref, got[0].data(), got[1].data(), got[2].data(), aIn,
                                 got[3].data(), got[4].data(), got[5].data(), got[6].data(),
                                 got[7].data(), sIn),
              0u);
    // Character j of the read bit text is bit n-1-j of the data.
    const auto readBit = [&](size_t j) { return bitOf(readData, n - 1 - j); };
    for (uint32_t i = 0; i < aIn; ++i) {
      for (int k = 0; k < 3; ++k) ASSERT_EQ(bitOf(got[k], i), readBit(4 * i + k)) << "async " << i;
    }
    for (uint32_t i = 0; i < sIn; ++i) {
      for (int k = 0; k < 5; ++k)
        ASSERT_EQ(bitOf(got[3 + k], i), readBit(4 * aIn + 6 * i + k)) << "sync " << i;
    }
    ZinJtag_closeSession(handle);
  }
}

}  // namespace
