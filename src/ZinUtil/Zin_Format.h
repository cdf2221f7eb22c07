// The one place of the utility library that knows how digits and bits are written: the digit
// tables and the word-at-a-time readers of bit texts that every conversion uses (internal).
#ifndef ZINUTIL_ZIN_FORMAT_H
#define ZINUTIL_ZIN_FORMAT_H

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>
#if defined(__SSE2__)
#include <emmintrin.h>
#endif

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

/// The top bit (0x80) of each byte of `word` that is a hexadecimal digit of either case, and
/// zero in every other byte.
inline uint64_t hexDigitBytes(uint64_t word) {
  constexpr uint64_t ones = 0x0101010101010101ull;
  constexpr uint64_t high = 0x8080808080808080ull;
  const uint64_t low = word & ~high;  // seven bits per byte: the sums below carry into no neighbour
  const auto inRange = [](uint64_t w, uint64_t first, uint64_t last) {
    return (w + (0x80 - first) * ones) & ~(w + (0x7F - last) * ones) & high;
  };
  // Setting bit 5 turns 'A'-'F' into 'a'-'f' and leaves the digits as they are.
  return ~word & high & (inRange(low, '0', '9') | inRange(low | 0x2020202020202020ull, 'a', 'f'));
}

/// Whether all eight characters of a word are hexadecimal digits.
inline bool isHexWord(uint64_t word) {
  return hexDigitBytes(word) == 0x8080808080808080ull;
}

/// The eight digits of a hexadecimal word (isHexWord) as four bytes, each from a pair of digits
/// read most significant first: byte m of the result (least significant first) is the value of
/// characters 2m and 2m+1.
inline uint32_t hexWordPairs(uint64_t word) {
  // A letter has bit 6 set and its value minus 9 in its low four bits.
  const uint64_t nibbles =
      (word & 0x0F0F0F0F0F0F0F0Full) + ((word >> 6) & 0x0101010101010101ull) * 9;
  uint64_t pairs =
      ((nibbles & 0x000F000F000F000Full) << 4) | ((nibbles >> 8) & 0x000F000F000F000Full);
  pairs = (pairs | (pairs >> 8)) & 0x0000FFFF0000FFFFull;
  return static_cast<uint32_t>(pairs | (pairs >> 16));
}

/// Two bytes whose bit k is 1 exactly where character k of the sixteen at `text` is '1' (the
/// first character is bit 0).
inline unsigned onesLsbFirst16(const char* text) {
#if defined(__SSE2__)
  const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text));
  return static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(v, _mm_set1_epi8('1'))));
#else
  return onesWordLsbFirst(loadWord(text)) | (onesWordLsbFirst(loadWord(text + 8)) << 8);
#endif
}

/// Sixteen hexadecimal digits of either case at `text` as eight bytes, each from a pair of digits
/// read most significant first (byte m of the result, least significant first, is the value of
/// characters 2m and 2m+1); false, with `pairs` unspecified, when any of them is not a digit.
inline bool hexPairs16(const char* text, uint64_t& pairs) {
#if defined(__SSE2__)
  const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text));
  const __m128i folded = _mm_or_si128(v, _mm_set1_epi8(0x20));  // 'A'-'F' become 'a'-'f'
  // Signed comparisons: a byte of 0x80 or more is below every bound and fails both ranges.
  const __m128i digit = _mm_and_si128(_mm_cmpgt_epi8(v, _mm_set1_epi8('0' - 1)),
                                      _mm_cmplt_epi8(v, _mm_set1_epi8('9' + 1)));
  const __m128i letter = _mm_and_si128(_mm_cmpgt_epi8(folded, _mm_set1_epi8('a' - 1)),
                                       _mm_cmplt_epi8(folded, _mm_set1_epi8('f' + 1)));
  if (_mm_movemask_epi8(_mm_or_si128(digit, letter)) != 0xFFFF) return false;
  // A letter's value is its low four bits plus 9; digits and letters differ in bit 6.
  const __m128i nine = _mm_and_si128(letter, _mm_set1_epi8(9));
  const __m128i nibbles = _mm_add_epi8(_mm_and_si128(v, _mm_set1_epi8(0x0F)), nine);
  // Each 16-bit lane holds characters 2m (low byte) and 2m+1 (high byte).
  const __m128i high = _mm_and_si128(_mm_slli_epi16(nibbles, 4), _mm_set1_epi16(0x00F0));
  const __m128i bytes = _mm_or_si128(high, _mm_srli_epi16(nibbles, 8));
  const __m128i packed = _mm_packus_epi16(bytes, bytes);
  std::memcpy(&pairs, &packed, sizeof pairs);
  return true;
#else
  const uint64_t early = loadWord(text);
  const uint64_t late = loadWord(text + 8);
  if (!isHexWord(early) || !isHexWord(late)) return false;
  pairs = uint64_t{hexWordPairs(early)} | (uint64_t{hexWordPairs(late)} << 32);
  return true;
#endif
}

}  // namespace ZinRT::detail

#endif
