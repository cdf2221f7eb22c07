// Hexadecimal value texts of the named-value calls.
#ifndef ZINMOX_HEXTEXT_H
#define ZINMOX_HEXTEXT_H

#include <cstdint>

#include "framework/ZinMOX_Framework.h"

namespace ZinRT::mox {

/// A value text fitted to a width without being copied: the fitted text is `fill` repeated
/// `fillCount` times, then the `keptCount` characters at `kept` (which point into the text).
struct FittedHex {
  char fill;
  size_t fillCount;
  const char* kept;
  size_t keptCount;
  size_t size() const { return fillCount + keptCount; }
};

/// Fits a value text to `bitWidth` bits: D = 2*ceil(bitWidth/8) digits, most significant first.
/// A shorter text is sign-extended (filled with "F" when its first digit is 8 or more, else "0"),
/// a longer one keeps its last D characters. Fails with "Invalid Hex String: " followed by the
/// first character (when it cannot choose the fill digit), by the whole text (any other
/// non-digit among the D), or by nothing (an empty text).
FittedHex fitHexString(const char* text, int32_t bitWidth);

/// Converts digits `first` to `last` (inclusive, `first` <= `last` < size) of a fitted text into
/// `out` as the framework's hex2Bin does: the last two digits into byte 0. Digits that lie in the
/// text are read where they are; a range that takes fill digits is put together in `scratch`.
void fittedToBin(const FittedHex& fitted, size_t first, size_t last, Zin_ByteBuffer& scratch,
                 Zin_ByteBuffer& out);

/// The value of a hexadecimal text with an optional "0x"/"0X" prefix; fails with
/// "Invalid Hex String: " followed by the text on any other character.
uint32_t parseHexString(const char* text);

}  // namespace ZinRT::mox

#endif
