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
#if defined(__SSE2__)
#include <emmintrin.h>
#endif

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

/// Whether all eight characters of a word are hexadecimal digits of either case.
inline bool isHexWord(uint64_t word) {
  constexpr uint64_t ones = 0x0101010101010101ull;
  constexpr uint64_t high = 0x8080808080808080ull;
  const uint64_t low = word & ~high;  // seven bits per byte: the sums below carry into no neighbour
  const auto inRange = [](uint64_t w, uint64_t first, uint64_t last) {
    return (w + (0x80 - first) * ones) & ~(w + (0x7F - last) * ones) & high;
  };
  // Setting bit 5 turns 'A'-'F' into 'a'-'f' and leaves the digits as they are.
  const uint64_t digits = inRange(low, '0', '9') | inRange(low | 0x2020202020202020ull, 'a', 'f');
  return (~word & high & digits) == high;
}

/// Whether all `n` characters of `text` are hexadecimal digits of either case.
inline bool allHexDigits(const char* text, size_t n) {
  size_t i = 0;
#if defined(__SSE2__)
  // Signed comparisons: a byte of 0x80 or more is below every bound and fails both ranges.
  for (; n - i >= 16; i += 16) {
    const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text + i));
    const __m128i folded = _mm_or_si128(v, _mm_set1_epi8(0x20));  // 'A'-'F' become 'a'-'f'
    const __m128i digit = _mm_and_si128(_mm_cmpgt_epi8(v, _mm_set1_epi8('0' - 1)),
                                        _mm_cmplt_epi8(v, _mm_set1_epi8('9' + 1)));
    const __m128i letter = _mm_and_si128(_mm_cmpgt_epi8(folded, _mm_set1_epi8('a' - 1)),
                                         _mm_cmplt_epi8(folded, _mm_set1_epi8('f' + 1)));
    if (_mm_movemask_epi8(_mm_or_si128(digit, letter)) != 0xFFFF) return false;
  }
#endif
  for (; n - i >= 8; i += 8) {
    if (!isHexWord(loadWord(text + i))) return false;
  }
  for (; i < n; ++i) {
    if (hexDigitValue(text[i]) < 0) return false;
  }
  return true;
}

/// The eight bit characters of a word as a byte, the first character most significant.
inline unsigned bitWordMsbFirst(uint64_t word) {
  return static_cast<unsigned>(((word & 0x0101010101010101ull) * 0x8040201008040201ull) >> 56);
}

/// Eight bytes of packed data as one word, the first byte least significant on every machine.
inline uint64_t loadPacked(const unsigned char* data) {
  return loadWord(reinterpret_cast<const char*>(data));
}

/// Bits 0, 6, 12, ..., 42 of `word` as bits 0 to 7 of a byte. One product moves every bit to its
/// place: the masked bits times 2^0 + 2^5 + 2^10 + 2^15 put bit 6m of each half at 15 + m (low
/// half) or 39 + m - 4 (high half), and no two other partial products meet, so nothing carries.
inline unsigned gatherEverySixth(uint64_t word) {
  const uint64_t product = (word & 0x041041041041ull) * 0x8421u;
  return static_cast<unsigned>(((product >> 15) & 0x0Fu) | ((product >> 35) & 0xF0u));
}

/// Bits 0, 4, 8, ..., 28 of `word` as bits 0 to 7 of a byte, in the same way (factors 2^0 + 2^3 +
/// 2^6 + 2^9: bit 4m lands on 9 + m or 21 + m).
inline unsigned gatherEveryFourth(uint64_t word) {
  const uint64_t product = (word & 0x11111111ull) * 0x249u;
  return static_cast<unsigned>(((product >> 9) & 0x0Fu) | ((product >> 21) & 0xF0u));
}

/// A byte whose bit k is 1 exactly where character k of `word` is '1' (the first character is
/// bit 0).
inline unsigned onesWordLsbFirst(uint64_t word) {
  const uint64_t diff = word ^ 0x3131313131313131ull;  // zero bytes where the character is '1'
  const uint64_t low7 = 0x7F7F7F7F7F7F7F7Full;
  const uint64_t nonZero = (((diff & low7) + low7) | diff) & 0x8080808080808080ull;
  const uint64_t ones = (~nonZero & 0x8080808080808080ull) >> 7;
  return static_cast<unsigned>((ones * 0x0102040810204080ull) >> 56);
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

/// The hexadecimal text of the `n` least significant bits of a packed vector (bit i in bit i mod
/// 8 of byte i/8): ceil(n/4) upper-case digits, most significant first, the bits of the first
/// digit above bit n-1 taken as zero.
inline void packedHexText(const unsigned char* data, uint32_t n, std::string& text) {
  const uint32_t digits = (n + 3) / 4;
  text.resize(digits);
  char* end = text.data() + digits;
  const uint32_t whole = digits / 2;
  uint32_t q = 0;
#if defined(__SSE2__)
  // Eight bytes give sixteen digits at once: byte-swapped, the last of them comes first; its
  // high and low nibbles are interleaved and turned into digits together.
  for (; whole - q >= 8; q += 8) {
    const auto word = static_cast<long long>(__builtin_bswap64(loadPacked(data + q)));
    const __m128i bytes = _mm_set_epi64x(0, word);
    const __m128i mask = _mm_set1_epi8(0x0F);
    const __m128i nibbles = _mm_unpacklo_epi8(_mm_and_si128(_mm_srli_epi16(bytes, 4), mask),
                                              _mm_and_si128(bytes, mask));
    const __m128i letters =
        _mm_and_si128(_mm_cmpgt_epi8(nibbles, _mm_set1_epi8(9)), _mm_set1_epi8('A' - '0' - 10));
    const __m128i chars = _mm_add_epi8(_mm_add_epi8(nibbles, _mm_set1_epi8('0')), letters);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(end - 2 * q - 16), chars);
  }
#endif
  for (; q < whole; ++q) std::memcpy(end - 2 * q - 2, kByteDigits[data[q]].data(), 2);
  if (digits % 2 != 0) text[0] = kHexDigits[data[whole] & 0x0Fu];
  if (n % 4 != 0) text[0] = kHexDigits[hexDigitValue(text[0]) & ((1u << (n % 4)) - 1)];
}

/// Each byte value with its bits in reverse order.
inline constexpr std::array<uint8_t, 256> kReversedBits = [] {
  std::array<uint8_t, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned k = 0; k < 8; ++k) table[b] |= static_cast<uint8_t>(((b >> k) & 1u) << (7 - k));
  }
  return table;
}();

/// The two digits of eight bit characters by the byte of their ones (bit k for character k): the
/// first character is the top bit of the first digit.
inline constexpr auto kFirstBitHighDigits = [] {
  std::array<std::array<char, 2>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) table[b] = kByteDigits[kReversedBits[b]];
  return table;
}();

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
#if defined(__SSE2__)
    if (end - p >= 32) {
      // At most three single characters complete the pending digit; from there on, sixteen
      // characters are four whole digits, two for each byte of their ones.
      for (; pending_ != 0; ++p) {
        if (*p != '0' && *p != '1') return false;
        pushBit(*p == '1' ? 1u : 0u);
      }
      for (; end - p >= 16; p += 16) {
        const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
        const __m128i bitChars = _mm_cmpeq_epi8(_mm_and_si128(v, _mm_set1_epi8('\xFE')),
                                                _mm_set1_epi8('0'));  // '0' and '1' only
        if (_mm_movemask_epi8(bitChars) != 0xFFFF) return false;
        const auto ones =
            static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(v, _mm_set1_epi8('1'))));
        std::memcpy(next_, kFirstBitHighDigits[ones & 0xFF].data(), 2);
        std::memcpy(next_ + 2, kFirstBitHighDigits[ones >> 8].data(), 2);
        next_ += 4;
      }
    }
#endif
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
  bool done() const {
    return next_ == end_ && pending_ == 0;
  }

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
