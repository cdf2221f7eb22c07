// Zin_ByteBuffer: storage and bit fields (its hexadecimal texts are in format_test.cpp).
#include <gtest/gtest.h>

#include <stdexcept>
#include <string>

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
