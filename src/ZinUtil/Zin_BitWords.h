// Word-at-a-time helpers for bit texts: eight '0'/'1' characters at once (internal).
#ifndef ZINUTIL_ZIN_BITWORDS_H
#define ZINUTIL_ZIN_BITWORDS_H

#include <bit>
#include <cstdint>
#include <cstring>

namespace ZinRT::detail {

/// Whether the word helpers apply: they read eight characters as one little-endian word.
inline constexpr bool kWordBitTexts = std::endian::native == std::endian::little;

inline uint64_t loadWord(const char* text) {
  uint64_t word;
  std::memcpy(&word, text, sizeof word);
  return word;
}

/// Whether all eight characters are '0' or '1'.
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
