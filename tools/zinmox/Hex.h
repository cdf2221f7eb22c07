// Hexadecimal texts of the command line and packed bit vectors.
#ifndef ZINMOX_TOOL_HEX_H
#define ZINMOX_TOOL_HEX_H

#include <cstdint>
#include <string>
#include <vector>

namespace zinmox {

/// Removes an optional "0x"/"0X" prefix and checks that what remains is a non-empty text of
/// hexadecimal digits. Throws UsageError naming `what` (for example "the value of leds").
std::string cleanHex(const std::string& text, const std::string& what);

/// The `bitCount` bits of a packed vector (bit i in bit i mod 8 of byte i/8) as ceil(bitCount/4)
/// upper-case digits, the most significant first.
std::string packedToHex(const std::vector<uint8_t>& packed, uint32_t bitCount);

/// A hexadecimal text (cleaned by cleanHex) as a packed vector of ceil(bitCount/8) bytes. Shorter
/// texts are filled with zeros on the left; a value with bits set at or above `bitCount` throws
/// UsageError, so nothing is cut off silently.
std::vector<uint8_t> hexToPacked(const std::string& text, uint32_t bitCount,
                                 const std::string& what);

}  // namespace zinmox

#endif
