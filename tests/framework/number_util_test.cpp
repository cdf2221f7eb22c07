// Conversions of Zin_NumberUtil: known values, malformed input, and round trips through the
// reverse conversion for random lengths.
#include <gtest/gtest.h>

#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinRT/Zin_NumberUtil.h"

using ZinRT::Zin_NumberUtil;

namespace {

std::string randomBits(std::mt19937& rng, size_t n) {
  std::string bits(n, '0');
  for (auto& c : bits) c = (rng() & 1u) != 0 ? '1' : '0';
  return bits;
}

}  // namespace

TEST(NumberUtil, KnownValues) {
  std::string out = "left over";
  EXPECT_EQ(Zin_NumberUtil::uInt2DecStr(0, out), "0");
  EXPECT_EQ(Zin_NumberUtil::uInt2DecStr(4294967295u, out), "4294967295");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0x2A, 8, out), "2A");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0x3, 4, out), "3");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0xABCDEF01u, 32, out), "ABCDEF01");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0x5, 32, out), "00000005");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0, 0, out), "");
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr("1010", out), "A");
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr("11010", out), "1A");
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr("", out), "");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("1A", 5, out), "11010");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("1a", 10, out), "0000011010");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("FF", 3, out), "111");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("", 4, out), "0000");
  const unsigned char packed[] = {0x01, 0x80};
  EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(packed, 16, out), "1000000000000001");
  EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(packed, 3, out), "100");
}

TEST(NumberUtil, ValueTooWideForHexWidthIsRejected) {
  std::string out;
  EXPECT_THROW(Zin_NumberUtil::uInt2HexStr(0x100, 8, out), std::out_of_range);
  EXPECT_THROW(Zin_NumberUtil::uInt2HexStr(1, 0, out), std::out_of_range);
  EXPECT_THROW(Zin_NumberUtil::uInt2HexStr(0x10, 6, out), std::out_of_range);
}

TEST(NumberUtil, MalformedInputIsRejected) {
  std::string out;
  EXPECT_THROW(Zin_NumberUtil::binStr2HexStr("10x1", out), std::invalid_argument);
  EXPECT_THROW(Zin_NumberUtil::hexStr2BinStr("1G", 8, out), std::invalid_argument);
  // Digits above the kept bits are checked too.
  EXPECT_THROW(Zin_NumberUtil::hexStr2BinStr("Z1", 4, out), std::invalid_argument);
  EXPECT_THROW(Zin_NumberUtil::hexStr2BinStr(nullptr, 4, out), std::invalid_argument);
  EXPECT_THROW(Zin_NumberUtil::bin2ReverseBinStr(nullptr, 1, out), std::invalid_argument);
}

TEST(NumberUtil, ReverseBinStr2BinClearsSpareBitsAndPacksOthersAsZero) {
  unsigned char out[2] = {0xFF, 0xFF};
  Zin_NumberUtil::reverseBinStr2Bin(
      "1x01"
      "0001"
      "1",
      out);
  EXPECT_EQ(out[0], 0x89);
  EXPECT_EQ(out[1], 0x01);
}

TEST(NumberUtil, BitTextAndHexTextRoundTrip) {
  std::mt19937 rng(1234);
  std::string hex;
  std::string back;
  for (int round = 0; round < 200; ++round) {
    const size_t n = rng() % 300;
    const std::string bits = randomBits(rng, n);
    Zin_NumberUtil::binStr2HexStr(bits, hex);
    ASSERT_EQ(hex.size(), (n + 3) / 4);
    Zin_NumberUtil::hexStr2BinStr(hex.c_str(), static_cast<uint32_t>(n), back);
    ASSERT_EQ(back, bits) << "n=" << n;
  }
}

TEST(NumberUtil, PackedVectorAndReverseBitTextRoundTrip) {
  std::mt19937 rng(99);
  std::string text;
  for (int round = 0; round < 200; ++round) {
    const size_t n = rng() % 300;
    const std::string bits = randomBits(rng, n);
    std::vector<unsigned char> packed((n + 7) / 8 + 1, 0xA5);
    Zin_NumberUtil::reverseBinStr2Bin(bits, packed.data());
    ASSERT_EQ(packed.back(), 0xA5) << "wrote past ceil(n/8) bytes, n=" << n;
    Zin_NumberUtil::bin2ReverseBinStr(packed.data(), static_cast<uint32_t>(n), text);
    ASSERT_EQ(text, bits) << "n=" << n;
  }
}

TEST(NumberUtil, OutputStringMayAlsoBeTheInput) {
  std::string text = "11010";
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(text, text), "1A");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(text.c_str(), 8, text), "00011010");
}
