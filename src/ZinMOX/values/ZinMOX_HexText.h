// Hexadecimal value texts of the named-value calls.
#ifndef ZINMOX_HEXTEXT_H
#define ZINMOX_HEXTEXT_H

#include <cstdint>
#include <memory>

#include "framework/ZinMOX_Framework.h"

namespace ZinRT::mox {

/// Fits a value text to `bitWidth` bits: D = 2*ceil(bitWidth/8) digits, most significant first.
/// A shorter text is sign-extended (filled with "F" when its first digit is 8 or more, else "0"),
/// a longer one keeps its last D characters. Returns a new buffer with the D digits and a zero
/// byte. Fails with "Invalid Hex String: " followed by the first character (when it cannot choose
/// the fill digit), by the whole text (any other non-digit), or by nothing (an empty text).
std::unique_ptr<Zin_ByteBuffer> fitHexString(const char* text, int32_t bitWidth);

/// The value of a hexadecimal text with an optional "0x"/"0X" prefix; fails with
/// "Invalid Hex String: " followed by the text on any other character.
uint32_t parseHexString(const char* text);

}  // namespace ZinRT::mox

#endif
