// The one place of the utility library that knows how digits and bits are written: the digit
// tables and the word-at-a-time readers of bit texts that every conversion uses (internal).
#ifndef ZINUTIL_ZIN_FORMAT_H
#define ZINUTIL_ZIN_FORMAT_H

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

namespace ZinRT::detail {

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

/// The value of hexadecimal digit `c`; throws std::invalid_argument naming `where` and the
/// character otherwise.
int hexValue(char c, const char* where);

/// The two hexadecimal digits of each byte value.
inline constexpr std::array<std::array<char, 2>, 256> kByteDigits = [] {
  std::array<std::array<char, 2>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) table[b] = {kHexDigits[b >> 4], kHexDigits[b & 0x0F]};
  return table;
}();

/// The bit text of each byte value with bit 0 first (a reverse bit text).
inline constexpr std::array<std::array<char, 8>, 256> kByteBitsLsbFirst = [] {
  std::array<std::array<char, 8>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned i = 0; i < 8; ++i) table[b][i] = ((b >> i) & 1u) != 0 ? '1' : '0';
  }
  return table;
}();

/// The four-character bit text of each digit value, most significant bit first.
inline constexpr std::array<std::array<char, 4>, 16> kDigitBits = [] {
  std::array<std::array<char, 4>, 16> table{};
  for (unsigned v = 0; v < 16; ++v) {
    for (unsigned j = 0; j < 4; ++j) table[v][j] = ((v >> (3 - j)) & 1u) != 0 ? '1' : '0';
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

/// The eight bit characters of `word` (first character most significant) as a byte.
inline unsigned bitWordMsbFirst(uint64_t word) {
  return static_cast<unsigned>(((word & 0x0101010101010101ull) * 0x8040201008040201ull) >> 56);
}

/// A byte whose bit i is 1 exactly where character i of `word` is '1'.
inline unsigned onesWordLsbFirst(uint64_t word) {
  const uint64_t diff = word ^ 0x3131313131313131ull;  // zero bytes where the character is '1'
  const uint64_t low7 = 0x7F7F7F7F7F7F7F7Full;
  const uint64_t nonZero = (((diff & low7) + low7) | diff) & 0x8080808080808080ull;
  const uint64_t ones = (~nonZero & 0x8080808080808080ull) >> 7;
  return static_cast<unsigned>((ones * 0x0102040810204080ull) >> 56);
}

}  // namespace ZinRT::detail

#endif
