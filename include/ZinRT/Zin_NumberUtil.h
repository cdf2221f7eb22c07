// Number and text conversions of the framework's utility library.
#ifndef ZINRT_ZIN_NUMBERUTIL_H
#define ZINRT_ZIN_NUMBERUTIL_H

#include <cstdint>
#include <string>

#include "ZinRT/ZinUtil_Export.h"

namespace ZinRT {

/// Static conversions between numbers, hexadecimal texts, bit texts and packed bit vectors.
/// Every operation that is given an output string replaces its content and returns it.
///
/// Texts:
/// - a hexadecimal text is most significant digit first, upper-case digits on output, either
///   case accepted on input;
/// - a bit text ("binary string") of '0'/'1' characters is most significant bit first, like a
///   number written in base 2;
/// - a reverse bit text has character i equal to bit i of a packed vector;
/// - a packed vector holds bit i in bit (i mod 8) of byte i/8.
/// Malformed input (a character outside the digit set) throws std::invalid_argument, as does a
/// null input pointer where input is expected. Each conversion works in one pass and may be
/// given the same string as input and output.
class ZINUTIL_API Zin_NumberUtil {
 public:
  /// Decimal text of `value`, no leading zeros.
  static std::string& uInt2DecStr(uint32_t value, std::string& out);
  /// The value 0 to 15 of a hexadecimal digit of either case, or -1 for any other character.
  static int hexDigitValue(char c);
  /// Hexadecimal text of `value` with exactly widthBits/4 digits, zero padded. Throws
  /// std::out_of_range when the value needs more digits (widthBits 0 gives the empty text
  /// for 0). A width that is not a multiple of 4 is rounded down to one.
  static std::string& uInt2HexStr(uint32_t value, uint32_t widthBits, std::string& out);
  /// Hexadecimal text of the number that the bit text `bits` spells: ceil(n/4) digits for n
  /// bits, the bit text padded with zeros on the left to a multiple of four. The empty bit text
  /// gives the empty text.
  static std::string& binStr2HexStr(const std::string& bits, std::string& out);
  /// The `bitCount` least significant bits of the number that the hexadecimal text `hex` spells,
  /// as a bit text of exactly `bitCount` characters (zeros on the left when the text has fewer
  /// bits). The reverse of binStr2HexStr. Every digit of the text is checked, also those above
  /// the bits kept.
  static std::string& hexStr2BinStr(const char* hex, uint32_t bitCount, std::string& out);
  /// Reverse bit text of the first `bitCount` bits of the packed vector `data`.
  static std::string& bin2ReverseBinStr(const unsigned char* data, uint32_t bitCount,
                                        std::string& out);
  /// Packs the reverse bit text `bits` into ceil(n/8) bytes at `out`. Spare high bits of the last
  /// byte are cleared. Characters other than '1' pack as 0.
  static unsigned char* reverseBinStr2Bin(const std::string& bits, unsigned char* out);
};

}  // namespace ZinRT

#endif
