// The utility library's number texts and byte ranges, every word-at-a-time conversion against
// bit-by-bit references over random lengths, the rejection texts of malformed input, and the byte
// buffer's storage and bit fields.
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_NumberUtil.h"
#include "support/WireFormat.h"

using ZinRT::Zin_ByteBuffer;
using ZinRT::Zin_NumberUtil;

namespace {

Zin_ByteBuffer textBuffer(const std::string& text) {
  return Zin_ByteBuffer(reinterpret_cast<const unsigned char*>(text.data()),
                        static_cast<uint32_t>(text.size()));
}

template <typename Call>
std::string rejection(Call call) {
  try {
    call();
  } catch (const std::invalid_argument& e) {
    return e.what();
  }
  return "accepted";
}

std::string lowerCase(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

}  // namespace

TEST(Format, NumbersAndByteRangesHaveKnownTexts) {
  std::string out = "left over";
  EXPECT_EQ(Zin_NumberUtil::uInt2DecStr(0, out), "0");
  EXPECT_EQ(Zin_NumberUtil::uInt2DecStr(4294967295u, out), "4294967295");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0x3, 4, out), "3");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0x5, 32, out), "00000005");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0xABCDEF01u, 32, out), "ABCDEF01");
  EXPECT_EQ(Zin_NumberUtil::uInt2HexStr(0, 0, out), "");
  EXPECT_THROW(Zin_NumberUtil::uInt2HexStr(0x100, 8, out), std::out_of_range);
  EXPECT_THROW(Zin_NumberUtil::uInt2HexStr(0x10, 6, out), std::out_of_range);
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("FF", 3, out), "111");  // high digits cut
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr("", 4, out), "0000");

  const unsigned char bytes[] = {0x02, 0x01, 0xAB};
  const Zin_ByteBuffer b(bytes, 3);
  Zin_ByteBuffer text = textBuffer("old");
  for (const auto& [start, expected] : std::vector<std::pair<uint32_t, const char*>>{
           {0, "AB0102"}, {1, "AB01"}, {3, ""}, {7, ""}}) {
    b.bin2HexString(start, text);
    EXPECT_STREQ(text.ptr(), expected) << start;
    EXPECT_EQ(text.getSize(), std::string(expected).size());
  }
  for (const auto& [bitCount, expected] : std::vector<std::pair<uint32_t, const char*>>{
           {9, "102"}, {10, "102"}, {12, "102"}, {32, "00AB0102"}, {0, ""}}) {
    std::unique_ptr<Zin_ByteBuffer> bits(b.bin2HexString(0, bitCount));
    EXPECT_STREQ(bits->ptr(), expected) << bitCount;
  }
  std::unique_ptr<Zin_ByteBuffer> middle(textBuffer("xfA3x").hex2Bin(1, 3));
  EXPECT_EQ((*middle)[0], 0xA3);
  EXPECT_EQ((*middle)[1], 0x0F);
  std::string shared = "11010";  // input and output may be the same string
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(shared, shared), "1A");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(shared.c_str(), 8, shared), "00011010");
}

// Lengths that are not multiples of 4 or 8, so that every conversion meets its partial words.
TEST(Format, ConversionsMatchBitByBitReferences) {
  using ZinTest::bitsToHex;
  using ZinTest::unpackBits;
  std::mt19937 rng(2024);
  std::string out;
  for (int round = 0; round < 300; ++round) {
    const auto n = static_cast<uint32_t>(rng() % 200);
    std::vector<uint8_t> bytes(n / 8 + 2);
    for (uint8_t& b : bytes) b = static_cast<uint8_t>(rng());
    const std::string reverse = unpackBits(bytes.data(), n);  // character i is bit i
    const std::string msbFirst(reverse.rbegin(), reverse.rend()), hex = bitsToHex(msbFirst);
    EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(msbFirst, out), hex) << n;
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(hex.c_str(), n, out), msbFirst);
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(lowerCase(hex).c_str(), n, out), msbFirst);
    EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(bytes.data(), n, out), reverse);
    std::vector<uint8_t> packed((n + 7) / 8 + 1, 0xEE);
    Zin_NumberUtil::reverseBinStr2Bin(reverse, packed.data());
    ASSERT_EQ(unpackBits(packed.data(), n), reverse) << n;
    ASSERT_EQ(packed.back(), 0xEE) << "wrote past ceil(n/8) bytes, n = " << n;

    const Zin_ByteBuffer buffer(bytes.data(), static_cast<uint32_t>(bytes.size()));
    const auto start = static_cast<uint32_t>(rng() % 3);
    std::unique_ptr<Zin_ByteBuffer> text(buffer.bin2HexString(start, n));
    std::vector<uint8_t> tail(bytes.begin() + start, bytes.end());
    tail.resize(n / 8 + 1, 0);  // bits past the buffer read as 0
    const std::string tailBits = unpackBits(tail.data(), n);
    EXPECT_EQ(std::string(text->ptr()), bitsToHex(std::string(tailBits.rbegin(), tailBits.rend())));
    if (hex.empty()) continue;
    std::unique_ptr<Zin_ByteBuffer> back(
        textBuffer(lowerCase(hex)).hex2Bin(0, static_cast<uint32_t>(hex.size() - 1)));
    ASSERT_EQ(unpackBits(back->uPtr(), n), reverse);
  }
}

TEST(Format, MalformedInputIsRejectedWithItsText) {
  std::string out;
  const std::string notBit = "Zin_NumberUtil::binStr2HexStr: not a bit character (code ",
                    notHex =
                        "Zin_NumberUtil::hexStr2BinStr: not a hexadecimal digit (character code ";
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::binStr2HexStr("10x1", out); }), notBit + "120)");
  // In a whole word too: the word reader must not take it for bits.
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::binStr2HexStr("1111111111112111", out); }),
            notBit + "50)");
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::hexStr2BinStr("1G", 8, out); }), notHex + "71)");
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::hexStr2BinStr("Z1", 4, out); }), notHex + "90)")
      << "digits above the kept bits are checked too";
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::hexStr2BinStr("x0G", 4, out); }), notHex + "71)")
      << "the last bad digit is met first";
  EXPECT_EQ(rejection([&] { delete textBuffer("12G4").hex2Bin(0, 3); }),
            "Zin_ByteBuffer::hex2Bin: not a hexadecimal digit (character code 71)");
  // Sixteen digits are converted at once: a bad one among them is still reported as the
  // conversion meets it from the last digit on, and every character is judged like the table.
  EXPECT_EQ(
      rejection([&] { delete textBuffer("Z0123456G89abcdef0123456789ABCDEF").hex2Bin(0, 32); }),
      "Zin_ByteBuffer::hex2Bin: not a hexadecimal digit (character code 71)");
  for (int c = 0; c < 256; ++c) {
    std::string text(16, 'a');
    text[c % 16] = static_cast<char>(c);
    const bool digit = Zin_NumberUtil::hexDigitValue(static_cast<char>(c)) >= 0;
    ASSERT_EQ(rejection([&] { delete textBuffer(text).hex2Bin(0, 15); }) == "accepted", digit) << c;
  }
  EXPECT_THROW(delete textBuffer("12").hex2Bin(0, 2), std::out_of_range);
  EXPECT_THROW(delete textBuffer("12").hex2Bin(1, 0), std::out_of_range);
  EXPECT_THROW(Zin_NumberUtil::hexStr2BinStr(nullptr, 4, out), std::invalid_argument);
  EXPECT_THROW(Zin_NumberUtil::bin2ReverseBinStr(nullptr, 1, out), std::invalid_argument);

  unsigned char packed[2] = {0xFF, 0xFF};
  Zin_NumberUtil::reverseBinStr2Bin("1x0100011", packed);  // anything but '1' packs as 0
  EXPECT_EQ(packed[0], 0x89);
  EXPECT_EQ(packed[1], 0x01);
}

TEST(ByteBuffer, StorageKeepsATerminatingZero) {
  Zin_ByteBuffer empty;
  EXPECT_EQ(empty.getSize(), 0u);
  EXPECT_STREQ(empty.ptr(), "");

  Zin_ByteBuffer zeros(154, 10, 10);
  EXPECT_EQ(zeros.getSize(), 154u);
  for (uint32_t i = 0; i < 154; ++i) ASSERT_EQ(zeros[i], 0);
  EXPECT_THROW(zeros[154], std::out_of_range);

  Zin_ByteBuffer text = textBuffer("AB");
  text.append(reinterpret_cast<const unsigned char*>("CD"), 2);
  EXPECT_STREQ(text.ptr(), "ABCD");
  text.append(text.uPtr(), 4);  // appending the buffer to itself
  EXPECT_STREQ(text.ptr(), "ABCDABCD");
  text.resize(3);
  EXPECT_STREQ(text.ptr(), "ABC");
  text.resize(5);
  EXPECT_EQ(text[3], 0);
  EXPECT_EQ(text[4], 0);

  Zin_ByteBuffer copy = text;
  Zin_ByteBuffer moved = std::move(text);
  EXPECT_EQ(copy.getSize(), 5u);
  EXPECT_STREQ(moved.ptr(), "ABC");
  EXPECT_EQ(text.getSize(), 0u);  // NOLINT: a moved-from buffer is empty and still usable
  EXPECT_STREQ(text.ptr(), "");
}

TEST(ByteBuffer, GetBitsReadsLittleEndianBitFields) {
  const unsigned char bytes[] = {0xB4, 0x5A, 0xFF, 0x01};
  const Zin_ByteBuffer b(bytes, 4);
  EXPECT_EQ(b.getBits(0, 8), 0xB4u);
  EXPECT_EQ(b.getBits(2, 4), 0xDu);   // bits 2..5 of 0xB4
  EXPECT_EQ(b.getBits(4, 8), 0xABu);  // high half of byte 0, low half of byte 1
  EXPECT_EQ(b.getBits(0, 32), 0x01FF5AB4u);
  EXPECT_EQ(b.getBits(20, 16), 0x001Fu);  // bits past the end read as 0
  EXPECT_EQ(b.getBits(1000, 16), 0u);
  EXPECT_EQ(b.getBits(3, 0), 0u);
  EXPECT_THROW(b.getBits(0, 33), std::invalid_argument);
}
