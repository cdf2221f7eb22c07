// The hub protocol's CRC-16: polynomial 0x1021, initial value 0xFFFF, no reflection, no final XOR,
// fed one bit per TCK in shift order.
#ifndef ZINHUB_CRC16_H
#define ZINHUB_CRC16_H

#include <cstddef>
#include <cstdint>

#include "ZinHub/Bits.h"

namespace ZinHub {

constexpr uint16_t kCrcInitial = 0xFFFF;

/// The register after feeding one bit.
constexpr uint16_t crcStep(uint16_t reg, unsigned bit) {
  const unsigned feedback = ((reg >> 15) & 1U) ^ (bit & 1U);
  reg = static_cast<uint16_t>(reg << 1);
  return feedback != 0 ? static_cast<uint16_t>(reg ^ 0x1021U) : reg;
}

/// The register after feeding bits[first .. first+count-1] from the initial value. The range
/// must lie within `bits`.
uint16_t crc16(const BitVector& bits, size_t first, size_t count);

/// Appends the register most significant bit first, so that a receiver feeding data and CRC
/// through the same register ends at 0.
void appendCrc(BitVector& bits, uint16_t crc);

}  // namespace ZinHub

#endif
