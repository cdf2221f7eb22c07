// The one place of the library that knows how digits and bits are written: digit and bit tables,
// word-at-a-time readers of bit texts, and the conversions of the hot paths built on them. The
// library may not reach into the framework's own tables, so it keeps these; everything slower
// goes through the framework's conversions.
#ifndef ZINMOX_BITFORMAT_H
#define ZINMOX_BITFORMAT_H

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

namespace ZinRT::mox {

/// Upper-case hexadecimal digits by value.
inline constexpr char kHexDigits[] = "0123456789ABCDEF";

/// Value of a hexadecimal digit by character, or -1 for any other character.
inline constexpr std::array<int8_t, 256> kHexValues = [] {
  std::array<int8_t, 256> table{};
  for (auto& v : table) v = -1;
  for (int i = 0; i < 10; ++i) table['0' + i] = static_cast<int8_t>(i);
  for (int i = 0; i < 6; ++i) {
    table['A' + i] = static_cast<int8_t>(10 + i);
    table['a' + i] = static_cast<int8_t>(10 + i);
  }
  return table;
}();

/// The value 0 to 15 of a hexadecimal digit of either case, or -1 for any other character.
inline int hexDigitValue(char c) {
  return kHexValues[static_cast<unsigned char>(c)];
}

/// The two hexadecimal digits of each byte value.
inline constexpr std::array<std::array<char, 2>, 256> kByteDigits = [] {
  std::array<std::array<char, 2>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) table[b] = {kHexDigits[b >> 4], kHexDigits[b & 0x0F]};
  return table;
}();

/// The bit text of each byte value: entry b, character k is bit 7-k (most significant first) or
/// bit k (least significant first).
inline constexpr auto kByteBitsMsbFirst = [] {
  std::array<std::array<char, 8>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned k = 0; k < 8; ++k) table[b][k] = ((b >> (7 - k)) & 1u) != 0 ? '1' : '0';
  }
  return table;
}();
inline constexpr auto kByteBitsLsbFirst = [] {
  std::array<std::array<char, 8>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned k = 0; k < 8; ++k) table[b][k] = ((b >> k) & 1u) != 0 ? '1' : '0';
  }
  return table;
}();

/// Eight characters as one word, the first character in the least significant byte on every
/// machine, so that the word helpers below need no byte-order variant.
inline uint64_t loadWord(const char* text) {
  uint64_t word;
  std::memcpy(&word, text, sizeof word);
  if constexpr (std::endian::native == std::endian::big) word = __builtin_bswap64(word);
  return word;
}

/// Whether all eight characters of a word are '0' or '1'.
inline bool isBitWord(uint64_t word) {
  return (word & 0xFEFEFEFEFEFEFEFEull) == 0x3030303030303030ull;
}

/// The eight bit characters of a word as a byte, the first character most significant.
inline unsigned bitWordMsbFirst(uint64_t word) {
  return static_cast<unsigned>(((word & 0x0101010101010101ull) * 0x8040201008040201ull) >> 56);
}

/// The bit text of the `n` least significant bits of a packed vector (bit i in bit i mod 8 of
/// byte i/8), read as a number most significant bit first: character j is bit n-1-j.
inline void msbFirstBitText(const unsigned char* data, uint32_t n, std::string& bits) {
  bits.resize(n);
  char* out = bits.data();
  const uint32_t whole = n / 8;
  const uint32_t rest = n % 8;
  for (uint32_t q = 0; q < whole; ++q) {
    std::memcpy(out + (n - 8 - 8 * q), kByteBitsMsbFirst[data[q]].data(), 8);
  }
  if (rest != 0) std::memcpy(out, kByteBitsMsbFirst[data[whole]].data() + (8 - rest), rest);
}

/// Writes, piece by piece, the hexadecimal text of a bit text given in pieces: upper-case
/// digits, most significant first, the whole bit text padded with zeros on the left to whole
/// digits (the framework's binStr2HexStr of the concatenated pieces). The text's room is sized
/// once from the announced bit count. A piece that holds anything but '0' and '1', or that does
/// not fit the announced count, makes add() return false; nothing is written past the room.
class HexTextWriter {
 public:
  /// Appends room for the text of `bitCount` bits to `out`.
  HexTextWriter(std::string& out, size_t bitCount) {
    const size_t start = out.size();
    out.resize(start + (bitCount + 3) / 4);
    next_ = out.data() + start;
    end_ = out.data() + out.size();
    pending_ = static_cast<unsigned>((4 - bitCount % 4) % 4);  // the padding zeros
  }

  bool add(const std::string& bits) {
    const char* p = bits.data();
    const char* end = p + bits.size();
    if ((pending_ + bits.size()) / 4 > static_cast<size_t>(end_ - next_)) return false;
    for (; end - p >= 8; p += 8) {
      const uint64_t word = loadWord(p);
      if (!isBitWord(word)) return false;
      pushByte(bitWordMsbFirst(word));
    }
    for (; p < end; ++p) {
      if (*p != '0' && *p != '1') return false;
      pushBit(*p == '1' ? 1u : 0u);
    }
    return true;
  }

  /// Sixteen characters (a step string).
  bool addSteps(const char* steps) {
    const uint64_t early = loadWord(steps);
    const uint64_t late = loadWord(steps + 8);
    if (!isBitWord(early) || !isBitWord(late) || end_ - next_ < 4) return false;
    // Fewer than four bits are pending: the sixteen new ones complete exactly four digits.
    bits_ = (bits_ << 16) | (bitWordMsbFirst(early) << 8) | bitWordMsbFirst(late);
    const auto digits = static_cast<unsigned>(bits_ >> pending_);
    std::memcpy(next_, kByteDigits[(digits >> 8) & 0xFF].data(), 2);
    std::memcpy(next_ + 2, kByteDigits[digits & 0xFF].data(), 2);
    next_ += 4;
    return true;
  }

  /// Whether exactly the announced number of bits was added (every digit of the room written).
  bool done() const { return next_ == end_ && pending_ == 0; }

 private:
  // Fewer than four bits are pending: eight new ones complete exactly two digits.
  void pushByte(unsigned byte) {
    bits_ = (bits_ << 8) | byte;
    std::memcpy(next_, kByteDigits[static_cast<unsigned>(bits_ >> pending_) & 0xFF].data(), 2);
    next_ += 2;
  }
  void pushBit(unsigned bit) {
    bits_ = (bits_ << 1) | bit;
    if (++pending_ == 4) {
      pending_ = 0;
      *next_++ = kHexDigits[bits_ & 0x0F];
    }
  }

  char* next_;
  char* end_;
  uint64_t bits_ = 0;
  unsigned pending_;
};

}  // namespace ZinRT::mox

#endif
