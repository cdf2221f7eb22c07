// Zin_ByteBuffer: storage, bit fields, and the hexadecimal conversions read back through their
// reverse.
#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"

using ZinRT::Zin_ByteBuffer;

namespace {

Zin_ByteBuffer textBuffer(const std::string& text) {
  return Zin_ByteBuffer(reinterpret_cast<const unsigned char*>(text.data()),
                        static_cast<uint32_t>(text.size()));
}

}  // namespace

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

TEST(ByteBuffer, HexTextsHaveKnownForms) {
  const unsigned char bytes[] = {0x02, 0x01, 0xAB};
  const Zin_ByteBuffer b(bytes, 3);
  Zin_ByteBuffer out = textBuffer("old");
  b.bin2HexString(0, out);
  EXPECT_STREQ(out.ptr(), "AB0102");
  EXPECT_EQ(out.getSize(), 6u);
  b.bin2HexString(1, out);
  EXPECT_STREQ(out.ptr(), "AB01");
  b.bin2HexString(3, out);
  EXPECT_STREQ(out.ptr(), "");

  std::unique_ptr<Zin_ByteBuffer> text(b.bin2HexString(0, 12));
  EXPECT_STREQ(text->ptr(), "102");
  text.reset(b.bin2HexString(0, 10));  // the spare bits of the top digit are left out
  EXPECT_STREQ(text->ptr(), "102");
  text.reset(b.bin2HexString(0, 9));
  EXPECT_STREQ(text->ptr(), "102");
  text.reset(b.bin2HexString(0, 8 * 3 + 8));  // past the end reads as zeros
  EXPECT_STREQ(text->ptr(), "00AB0102");
  text.reset(b.bin2HexString(0, 0));
  EXPECT_STREQ(text->ptr(), "");

  const Zin_ByteBuffer hex = textBuffer("0102");
  std::unique_ptr<Zin_ByteBuffer> bin(hex.hex2Bin(0, 3));
  ASSERT_EQ(bin->getSize(), 2u);
  EXPECT_EQ((*bin)[0], 0x02);
  EXPECT_EQ((*bin)[1], 0x01);
  const Zin_ByteBuffer odd = textBuffer("xfA3x");
  bin.reset(odd.hex2Bin(1, 3));
  ASSERT_EQ(bin->getSize(), 2u);
  EXPECT_EQ((*bin)[0], 0xA3);
  EXPECT_EQ((*bin)[1], 0x0F);
}

TEST(ByteBuffer, Hex2BinRejectsBadDigitsAndRanges) {
  const Zin_ByteBuffer hex = textBuffer("12G4");
  EXPECT_THROW(delete hex.hex2Bin(0, 3), std::invalid_argument);
  EXPECT_THROW(delete hex.hex2Bin(0, 4), std::out_of_range);
  EXPECT_THROW(delete hex.hex2Bin(2, 1), std::out_of_range);
  std::unique_ptr<Zin_ByteBuffer> ok(hex.hex2Bin(0, 1));
  EXPECT_EQ((*ok)[0], 0x12);
}

TEST(ByteBuffer, HexConversionsRoundTripForRandomLengths) {
  std::mt19937 rng(2024);
  for (int round = 0; round < 200; ++round) {
    const uint32_t size = rng() % 70;
    std::vector<unsigned char> bytes(size);
    for (auto& b : bytes) b = static_cast<unsigned char>(rng());
    const Zin_ByteBuffer data(bytes.data(), size);

    Zin_ByteBuffer text;
    data.bin2HexString(0, text);
    ASSERT_EQ(std::strlen(text.ptr()), 2u * size);
    if (size != 0) {
      std::unique_ptr<Zin_ByteBuffer> back(text.hex2Bin(0, text.getSize() - 1));
      ASSERT_EQ(back->getSize(), size);
      ASSERT_EQ(std::memcmp(back->uPtr(), bytes.data(), size), 0);
    }

    // Any bit count, also not a multiple of 4 or 8: the text holds exactly those bits.
    const uint32_t bitCount = rng() % (8 * size + 9);
    std::unique_ptr<Zin_ByteBuffer> bitsText(data.bin2HexString(0, bitCount));
    const uint32_t digits = (bitCount + 3) / 4;
    ASSERT_EQ(std::strlen(bitsText->ptr()), digits);
    if (digits == 0) continue;
    std::unique_ptr<Zin_ByteBuffer> bits(bitsText->hex2Bin(0, digits - 1));
    for (uint32_t i = 0; i < 8 * bits->getSize(); ++i) {
      const uint32_t expected = i < bitCount ? data.getBits(i, 1) : 0u;
      ASSERT_EQ(bits->getBits(i, 1), expected) << "bit " << i << " of " << bitCount;
    }
  }
}
