// The utility library's bit and hex formats, through every public conversion that uses them: one
// table of values in all four forms (bit text, hexadecimal text, reverse bit text, packed bytes),
// the rejection texts of malformed input, and round trips over every length up to 300 bits so
// that each word boundary and padding is crossed.
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_NumberUtil.h"

using ZinRT::Zin_ByteBuffer;
using ZinRT::Zin_NumberUtil;

namespace {

struct Form {
  std::string bits;  // most significant first
  std::string hex;
  std::vector<unsigned char> packed;  // bit i in bit i mod 8 of byte i/8
};

// Widths around the digit, byte and eight-character word boundaries.
const std::vector<Form> kForms = {
    {"", "", {}},
    {"1", "1", {0x01}},
    {"0110", "6", {0x06}},
    {"11010", "1A", {0x1A}},
    {"00001111", "0F", {0x0F}},
    {"111100001", "1E1", {0xE1, 0x01}},
    {"0000000011111111", "00FF", {0xFF, 0x00}},
    {"10101111000010010110100101", "2BC25A5", {0xA5, 0x25, 0xBC, 0x02}},
    {"11111111111111111111111111111110111111111111111111111111111111111",
     "1FFFFFFFDFFFFFFFF",
     {0xFF, 0xFF, 0xFF, 0xFF, 0xFD, 0xFF, 0xFF, 0xFF, 0x01}},
};

Zin_ByteBuffer textBuffer(const std::string& text) {
  return Zin_ByteBuffer(reinterpret_cast<const unsigned char*>(text.data()),
                        static_cast<uint32_t>(text.size()));
}

std::string lowerCase(std::string text) {
  for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
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

}  // namespace

TEST(Format, EveryConversionAgreesOnTheTableOfForms) {
  std::string out;
  for (const Form& f : kForms) {
    SCOPED_TRACE(f.bits);
    const auto n = static_cast<uint32_t>(f.bits.size());
    const std::string reverse(f.bits.rbegin(), f.bits.rend());
    EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(f.bits, out), f.hex);
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(f.hex.c_str(), n, out), f.bits);
    EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(lowerCase(f.hex).c_str(), n, out), f.bits);
    EXPECT_EQ(Zin_NumberUtil::bin2ReverseBinStr(f.packed.data(), n, out), reverse);
    std::vector<unsigned char> packed(f.packed.size() + 1, 0xEE);
    Zin_NumberUtil::reverseBinStr2Bin(reverse, packed.data());
    EXPECT_EQ(std::vector<unsigned char>(packed.begin(), packed.end() - 1), f.packed);
    EXPECT_EQ(packed.back(), 0xEE) << "wrote past ceil(n/8) bytes";

    const Zin_ByteBuffer bytes(f.packed.data(), static_cast<uint32_t>(f.packed.size()));
    std::unique_ptr<Zin_ByteBuffer> text(bytes.bin2HexString(0, n));
    EXPECT_STREQ(text->ptr(), f.hex.c_str());
    if (f.hex.empty()) continue;
    // hex2Bin reads whole digits: the packed bytes of the digits' value.
    const Zin_ByteBuffer digits = textBuffer(lowerCase(f.hex));
    std::unique_ptr<Zin_ByteBuffer> bin(digits.hex2Bin(0, digits.getSize() - 1));
    EXPECT_EQ(
        std::vector<unsigned char>(bin->uPtr(), bin->uPtr() + bin->getSize()),
        std::vector<unsigned char>(f.packed.begin(), f.packed.begin() + (f.hex.size() + 1) / 2));
  }
}

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
}

TEST(Format, MalformedInputIsRejectedWithItsText) {
  std::string out;
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::binStr2HexStr("10x1", out); }),
            "Zin_NumberUtil::binStr2HexStr: not a bit character (code 120)");
  // In a whole word too: the word reader must not take it for bits.
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::binStr2HexStr("1111111111112111", out); }),
            "Zin_NumberUtil::binStr2HexStr: not a bit character (code 50)");
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::hexStr2BinStr("1G", 8, out); }),
            "Zin_NumberUtil::hexStr2BinStr: not a hexadecimal digit (character code 71)");
  EXPECT_EQ(rejection([&] { Zin_NumberUtil::hexStr2BinStr("Z1", 4, out); }),
            "Zin_NumberUtil::hexStr2BinStr: not a hexadecimal digit (character code 90)")
      << "digits above the kept bits are checked too";
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

TEST(Format, EveryLengthRoundTripsAndMayShareItsOutput) {
  std::mt19937 rng(1234);
  std::string hex;
  std::string back;
  for (uint32_t n = 0; n <= 300; ++n) {
    std::string bits(n, '0');
    for (char& c : bits) c = (rng() & 1u) != 0 ? '1' : '0';
    Zin_NumberUtil::binStr2HexStr(bits, hex);
    ASSERT_EQ(hex.size(), (n + 3) / 4);
    ASSERT_EQ(Zin_NumberUtil::hexStr2BinStr(hex.c_str(), n, back), bits) << n;
    std::vector<unsigned char> packed((n + 7) / 8);
    Zin_NumberUtil::reverseBinStr2Bin(bits, packed.data());
    ASSERT_EQ(Zin_NumberUtil::bin2ReverseBinStr(packed.data(), n, back), bits) << n;
    const Zin_ByteBuffer bytes(packed.data(), static_cast<uint32_t>(packed.size()));
    Zin_ByteBuffer text;
    bytes.bin2HexString(0, text);
    if (text.getSize() == 0) continue;
    std::unique_ptr<Zin_ByteBuffer> again(text.hex2Bin(0, text.getSize() - 1));
    ASSERT_EQ(std::vector<unsigned char>(again->uPtr(), again->uPtr() + again->getSize()), packed);
  }
  std::string text = "11010";
  EXPECT_EQ(Zin_NumberUtil::binStr2HexStr(text, text), "1A");
  EXPECT_EQ(Zin_NumberUtil::hexStr2BinStr(text.c_str(), 8, text), "00011010");
}
