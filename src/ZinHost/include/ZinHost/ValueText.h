// Value texts as users give them to every client, and packed bit vectors.
//
// The clients take hexadecimal texts, most significant digit first. One rule holds in all of
// them: an optional "0x" or "0X" prefix is removed, and what remains must be one or more hex
// digits. The digits then go to the library unchanged, so its own rules apply (a shorter text is
// sign-extended from its first digit, a longer one keeps its last digits): "0x3F" and "3F" mean
// the same everywhere.
#ifndef ZINHOST_VALUETEXT_H
#define ZINHOST_VALUETEXT_H

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace ZinHost {

/// The digits of a value text after the "0x" rule above. Throws TextError naming `what` (for
/// example "the value of leds") for an empty text or a character that is not a hex digit.
std::string hexDigits(std::string_view text, const std::string& what);

/// The `bitCount` bits of a packed vector (bit i in bit i mod 8 of byte i/8) as
/// ceil(bitCount/4) upper-case digits, the most significant first; bits past the data are 0.
std::string packedToHex(std::span<const uint8_t> packed, uint64_t bitCount);

/// Hex digits (from hexDigits) as a packed vector of ceil(bitCount/8) bytes, zero-extended. A
/// value with a bit set at or above `bitCount` throws TextError naming `what`: nothing is cut off
/// silently.
std::vector<uint8_t> hexToPacked(std::string_view digits, uint64_t bitCount,
                                 const std::string& what);

/// Hex digits (from hexDigits) fitted to `bytes` bytes by the library's rule (sign-extended from
/// the first digit when short, the last 2 * `bytes` digits when long), little-endian.
std::vector<uint8_t> fitHexDigits(std::string_view digits, size_t bytes);

}  // namespace ZinHost

#endif
