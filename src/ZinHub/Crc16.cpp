// The hub protocol's CRC-16, bit-serial like the hub's own register.
#include "ZinHub/Crc16.h"

namespace ZinHub {

uint16_t crc16(const BitVector& bits, size_t first, size_t count) {
  uint16_t reg = kCrcInitial;
  for (size_t i = 0; i < count; ++i) reg = crcStep(reg, bits[first + i]);
  return reg;
}

void appendCrc(BitVector& bits, uint16_t crc) {
  for (int i = 15; i >= 0; --i) bits.push_back(static_cast<uint8_t>((crc >> i) & 1U));
}

}  // namespace ZinHub
