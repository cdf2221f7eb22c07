// Byte buffer of the framework's utility library.
#ifndef ZINRT_ZIN_BYTEBUFFER_H
#define ZINRT_ZIN_BYTEBUFFER_H

#include <cstdint>
#include <vector>

#include "ZinRT/ZinUtil_Export.h"

namespace ZinRT {

/// A resizable array of bytes that also serves as the holder of zero-terminated texts.
///
/// Bit numbering: bit i of a buffer is bit (i mod 8) of byte i/8, bit 0 being the least
/// significant bit of a byte. Read as a number, a buffer is little endian: byte 0 holds the
/// least significant eight bits.
///
/// Hexadecimal texts are most significant digit first with upper-case digits; lower-case digits
/// are accepted on input. A text therefore means the number it reads as.
///
/// A zero byte is always kept right after the last byte (it is not counted by getSize), so a
/// buffer whose bytes are characters can be used as a text through ptr(). A moved-from buffer is
/// empty.
class ZINUTIL_API Zin_ByteBuffer {
 public:
  /// An empty buffer (size 0).
  Zin_ByteBuffer();
  /// A buffer of `size` zero bytes. `reserve` bytes of spare capacity are kept beyond the size and
  /// `growBy` is the minimum step by which the capacity grows when the buffer is appended to.
  Zin_ByteBuffer(uint32_t size, uint32_t reserve, uint32_t growBy);
  /// A buffer holding a copy of `size` bytes at `data` (null reads as zeros).
  Zin_ByteBuffer(const unsigned char* data, uint32_t size);
  Zin_ByteBuffer(const Zin_ByteBuffer&);
  Zin_ByteBuffer(Zin_ByteBuffer&&) noexcept;
  Zin_ByteBuffer& operator=(const Zin_ByteBuffer&);
  Zin_ByteBuffer& operator=(Zin_ByteBuffer&&) noexcept;
  ~Zin_ByteBuffer();

  /// Number of bytes held.
  uint32_t getSize() const;
  /// Changes the size; new bytes are zero.
  void resize(uint32_t size);
  /// Appends `size` bytes.
  void append(const unsigned char* data, uint32_t size);

  /// The bytes. A buffer of size 0 still yields a valid pointer to a zero byte, so `ptr()` of an
  /// empty buffer is the empty text.
  unsigned char* uPtr();
  const unsigned char* uPtr() const;
  /// The bytes as characters (a zero-terminated text where the buffer holds one).
  char* ptr();
  const char* ptr() const;
  /// Byte `index`; throws std::out_of_range past the end.
  unsigned char& operator[](uint32_t index);
  unsigned char operator[](uint32_t index) const;

  /// The unsigned value of `length` (at most 32) consecutive bits starting at bit `bitOffset`;
  /// bit `bitOffset` becomes bit 0 of the result. Bits past the end of the buffer read as 0.
  /// A length above 32 throws std::invalid_argument.
  uint32_t getBits(uint32_t bitOffset, uint32_t length) const;

  /// Writes into `out` the zero-terminated hexadecimal text of the bytes from byte `start` to the
  /// end, read as a little-endian number: two digits per byte, the last byte first. `out` is
  /// replaced; `start` past the end gives the empty text. Afterwards `out.getSize()` is the number
  /// of digits (the terminating zero follows them, outside the size).
  void bin2HexString(uint32_t start, Zin_ByteBuffer& out) const;
  /// A new buffer (owned by the caller) with the zero-terminated hexadecimal text of the
  /// `bitCount` bits that start at byte `start`: ceil(bitCount/4) digits, the most significant
  /// first. Bits past the end of the buffer read as 0; bits of the first digit beyond `bitCount`
  /// are left out, so the text is exactly the value of those bits. The new buffer's size is the
  /// number of digits.
  Zin_ByteBuffer* bin2HexString(uint32_t start, uint32_t bitCount) const;
  /// This buffer holds a hexadecimal text; converts its digits `first` to `last` (inclusive) to a
  /// new buffer (owned by the caller) of ceil(digits/2) bytes, the last two digits into byte 0
  /// (the reverse of bin2HexString). With an odd number of digits the first one fills the low half
  /// of the last byte. Throws std::invalid_argument on a character that is not a hexadecimal digit
  /// and std::out_of_range when the range is not inside the buffer (or `first` > `last`).
  Zin_ByteBuffer* hex2Bin(uint32_t first, uint32_t last) const;
  /// The conversion of hex2Bin for the `count` digits at `digits`, into `out`, which is replaced
  /// and keeps its storage for the next call; afterwards `out.getSize()` is ceil(count/2).
  /// `digits` must not lie inside `out`. Throws std::invalid_argument on a character that is not
  /// a hexadecimal digit.
  static void hexDigits2Bin(const char* digits, uint32_t count, Zin_ByteBuffer& out);

 private:
  void ensureCapacity(uint32_t size);

  std::vector<unsigned char> bytes_;  // always holds size_ + 1 bytes at least (terminating zero)
  uint32_t size_ = 0;
  uint32_t growBy_ = 0;
};

}  // namespace ZinRT

#endif
