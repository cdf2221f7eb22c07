// Bit fields and hexadecimal texts of a byte buffer.
#include <algorithm>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <string>

#include "ZinRT/Zin_ByteBuffer.h"
#include "Zin_Format.h"

namespace ZinRT {

uint32_t Zin_ByteBuffer::getBits(uint32_t bitOffset, uint32_t length) const {
  if (length > 32) {
    throw std::invalid_argument("Zin_ByteBuffer::getBits: length " + std::to_string(length) +
                                " exceeds 32 bits");
  }
  if (length == 0) return 0;
  // At most five bytes hold the field; bytes past the end read as zero.
  const uint64_t firstByte = bitOffset / 8;
  const unsigned char* bytes = uPtr();
  uint64_t word = 0;
  for (uint64_t i = 0; i < 5; ++i) {
    const uint64_t index = firstByte + i;
    if (index >= size_) break;
    word |= static_cast<uint64_t>(bytes[index]) << (8 * i);
  }
  word >>= bitOffset % 8;
  const uint64_t mask = (uint64_t{1} << length) - 1;
  return static_cast<uint32_t>(word & mask);
}

void Zin_ByteBuffer::bin2HexString(uint32_t start, Zin_ByteBuffer& out) const {
  const uint32_t count = start < size_ ? size_ - start : 0;
  if (&out == this) {
    Zin_ByteBuffer text;
    bin2HexString(start, text);
    out = std::move(text);
    return;
  }
  out.resize(0);
  out.resize(2 * count);  // also keeps the terminating zero after the digits
  const unsigned char* bytes = uPtr() + start;
  char* digits = out.ptr();
  for (uint32_t i = 0; i < count; ++i) {
    std::memcpy(digits + 2 * i, detail::kByteDigits[bytes[count - 1 - i]].data(), 2);
  }
}

Zin_ByteBuffer* Zin_ByteBuffer::bin2HexString(uint32_t start, uint32_t bitCount) const {
  const uint32_t digitCount = bitCount / 4 + (bitCount % 4 != 0 ? 1 : 0);
  auto text = std::make_unique<Zin_ByteBuffer>(digitCount, 0, 0);
  char* digits = text->ptr();
  const unsigned char* bytes = uPtr();
  // Digit k (counted from the least significant) is nibble k of the bits from byte `start`;
  // whole bytes give two digits at once, bytes past the end read as zero.
  const uint64_t available = start < size_ ? size_ - start : 0;
  const uint32_t wholeBytes = static_cast<uint32_t>(std::min<uint64_t>(digitCount / 2, available));
  char* end = digits + digitCount;
  for (uint32_t i = 0; i < wholeBytes; ++i) {
    std::memcpy(end - 2 * static_cast<int64_t>(i) - 2, detail::kByteDigits[bytes[start + i]].data(),
                2);
  }
  for (uint32_t k = 2 * wholeBytes; k < digitCount; ++k) {
    const uint64_t index = static_cast<uint64_t>(start) + k / 2;
    unsigned nibble = 0;
    if (index < size_) nibble = (k % 2 == 0) ? (bytes[index] & 0x0F) : (bytes[index] >> 4);
    digits[digitCount - 1 - k] = detail::kHexDigits[nibble];
  }
  // Bits beyond bitCount in the most significant digit are not part of the value.
  if (bitCount % 4 != 0) {
    const unsigned top =
        static_cast<unsigned>(detail::kHexValues[static_cast<unsigned char>(digits[0])]);
    digits[0] = detail::kHexDigits[top & ((1u << (bitCount % 4)) - 1)];
  }
  return text.release();
}

Zin_ByteBuffer* Zin_ByteBuffer::hex2Bin(uint32_t first, uint32_t last) const {
  if (first > last || last >= size_) {
    throw std::out_of_range("Zin_ByteBuffer::hex2Bin: digits " + std::to_string(first) + " to " +
                            std::to_string(last) + " are not inside a text of " +
                            std::to_string(size_) + " characters");
  }
  auto bin = std::make_unique<Zin_ByteBuffer>();
  hexDigits2Bin(ptr() + first, last - first + 1, *bin);
  return bin.release();
}

void Zin_ByteBuffer::hexDigits2Bin(const char* digits, uint32_t count, Zin_ByteBuffer& out) {
  out.resize(0);
  out.resize(count / 2 + count % 2);  // zero-filled: the digits below are or-ed in
  unsigned char* bytes = out.uPtr();
  const char* last = digits + count - 1;
  // The last digit is the least significant: digit pairs fill the bytes from byte 0 upwards,
  // sixteen digits (eight bytes) at a time while they are all digits. The rest, and a block that
  // holds a bad digit, go one digit at a time, so a bad digit is reported as the conversion
  // meets it, from the last digit on.
  uint32_t k = 0;
  for (uint64_t pairs = 0; count - k >= 16 && detail::hexPairs16(last - k - 15, pairs); k += 16) {
    unsigned char* block = bytes + k / 2;  // pair m goes to byte k/2 + 7 - m
    for (unsigned m = 0; m < 8; ++m) block[7 - m] = static_cast<unsigned char>(pairs >> (8 * m));
  }
  for (; k < count; ++k) {
    int v = detail::kHexValues[static_cast<unsigned char>(last[-static_cast<ptrdiff_t>(k)])];
    if (v < 0) v = detail::hexValue(last[-static_cast<ptrdiff_t>(k)], "Zin_ByteBuffer::hex2Bin");
    bytes[k / 2] |= static_cast<unsigned char>(k % 2 == 0 ? v : v << 4);
  }
}

}  // namespace ZinRT
