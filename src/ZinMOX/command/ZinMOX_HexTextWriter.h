// The hexadecimal text of a bit text that is given in pieces (the output data of a write).
#ifndef ZINMOX_HEXTEXTWRITER_H
#define ZINMOX_HEXTEXTWRITER_H

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

namespace ZinRT::mox {

/// Whether eight bit characters can be read as one little-endian word.
inline constexpr bool kWordBitTexts = std::endian::native == std::endian::little;

/// Writes, piece by piece, the same text as the framework's binStr2HexStr gives for the
/// concatenated pieces: upper-case digits, most significant first, the bit text padded with
/// zeros on the left to whole digits. Eight characters are read as one word. A piece holding
/// anything but '0' and '1' makes add() return false (the text is then unusable), so the caller
/// can leave the reporting of the bad character to the framework's conversion.
class HexTextWriter {
 public:
  /// Appends the text of `bitCount` bits to `out`.
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
    if (static_cast<size_t>(end_ - next_) < bits.size() / 4) return false;
    for (; end - p >= 8; p += 8) {
      const uint64_t word = load(p);
      if (!isBitWord(word)) return false;
      pushByte(byteOf(word));
    }
    for (; p < end; ++p) {
      if (*p != '0' && *p != '1') return false;
      pushBit(*p == '1' ? 1u : 0u);
    }
    return true;
  }

  /// Sixteen characters (a step string).
  bool addSteps(const char* steps) {
    const uint64_t early = load(steps);
    const uint64_t late = load(steps + 8);
    if (!isBitWord(early) || !isBitWord(late) || end_ - next_ < 4) return false;
    // Fewer than four bits are pending: the sixteen new ones complete exactly four digits.
    bits_ = (bits_ << 16) | (byteOf(early) << 8) | byteOf(late);
    const auto digits = static_cast<unsigned>(bits_ >> pending_);
    std::memcpy(next_, BYTE_DIGITS[(digits >> 8) & 0xFF].data(), 2);
    std::memcpy(next_ + 2, BYTE_DIGITS[digits & 0xFF].data(), 2);
    next_ += 4;
    return true;
  }

  /// Whether exactly the announced number of bits was added.
  bool done() const { return next_ == end_ && pending_ == 0; }

 private:
  static uint64_t load(const char* p) {
    uint64_t word;
    std::memcpy(&word, p, sizeof word);
    return word;
  }
  static bool isBitWord(uint64_t word) {
    return (word & 0xFEFEFEFEFEFEFEFEull) == 0x3030303030303030ull;
  }
  // The eight characters as a byte, the first one most significant.
  static unsigned byteOf(uint64_t word) {
    return static_cast<unsigned>(((word & 0x0101010101010101ull) * 0x8040201008040201ull) >> 56);
  }

  // Fewer than four bits are pending: eight new ones complete exactly two digits.
  void pushByte(unsigned byte) {
    bits_ = (bits_ << 8) | byte;
    std::memcpy(next_, BYTE_DIGITS[static_cast<unsigned>(bits_ >> pending_) & 0xFF].data(), 2);
    next_ += 2;
  }
  void pushBit(unsigned bit) {
    bits_ = (bits_ << 1) | bit;
    if (++pending_ == 4) {
      pending_ = 0;
      *next_++ = BYTE_DIGITS[bits_ & 0x0F][1];
    }
  }

  // The two digits of each byte value.
  static constexpr std::array<std::array<char, 2>, 256> BYTE_DIGITS = [] {
    constexpr char DIGITS[] = "0123456789ABCDEF";
    std::array<std::array<char, 2>, 256> table{};
    for (unsigned b = 0; b < 256; ++b) table[b] = {DIGITS[b >> 4], DIGITS[b & 0x0F]};
    return table;
  }();

  char* next_;
  char* end_;
  uint64_t bits_ = 0;
  unsigned pending_;
};

}  // namespace ZinRT::mox

#endif
