// Bit vectors in shift order: element 0 is the first bit shifted in at TDI (or out at TDO).
#ifndef ZINHUB_BITS_H
#define ZINHUB_BITS_H

#include <cstddef>
#include <cstdint>
#include <vector>

namespace ZinHub {

/// One element per bit, each 0 or 1. Index 0 is the first bit of a scan.
using BitVector = std::vector<uint8_t>;

/// Appends the `count` low bits of `value`, least significant first (count at most 64).
inline void appendNumber(BitVector& bits, uint64_t value, unsigned count) {
  for (unsigned i = 0; i < count; ++i) bits.push_back(static_cast<uint8_t>((value >> i) & 1U));
}

/// Reads `count` bits (at most 64) from `first` as a number, the first bit least significant.
/// Bits beyond the end of `bits` read as 0.
inline uint64_t readNumber(const BitVector& bits, size_t first, unsigned count) {
  uint64_t value = 0;
  for (unsigned i = 0; i < count; ++i) {
    const size_t at = first + i;
    if (at < bits.size() && bits[at] != 0) value |= uint64_t{1} << i;
  }
  return value;
}

}  // namespace ZinHub

#endif
