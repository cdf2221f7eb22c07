// Hexadecimal fields of command lines.
#ifndef ZINSIM_HEXNUMBER_H
#define ZINSIM_HEXNUMBER_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace ZinSim {

/// Reads a field of exactly `digits` hexadecimal digits (either letter case).
bool parseHexField(std::string_view text, size_t digits, uint32_t& value);

/// Reads a hexadecimal number, most significant digit first, that must fit in `bitCount` bits.
/// On success fills `number` (if given) with ceil(bitCount/8) little-endian bytes and returns an
/// empty text; else returns what is wrong.
std::string parseHexNumber(std::string_view text, uint64_t bitCount, std::vector<uint8_t>* number);

}  // namespace ZinSim

#endif
