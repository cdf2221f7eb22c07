// Conversions between hexadecimal texts and packed bit vectors.
#include "Hex.h"

#include "ZinRT/Zin_NumberUtil.h"

#include <cctype>

#include "Errors.h"

namespace zinmox {

std::string cleanHex(const std::string& text, const std::string& what) {
  std::string digits = text;
  if (digits.size() >= 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) {
    digits = digits.substr(2);
  }
  if (digits.empty()) throw UsageError(what + " is empty: give hexadecimal digits such as 3F");
  for (char c : digits) {
    if (ZinRT::Zin_NumberUtil::hexDigitValue(c) < 0) {
      throw UsageError(what + " '" + text + "' is not a hexadecimal number (digits 0-9, A-F)");
    }
  }
  return digits;
}

std::string packedToHex(const std::vector<uint8_t>& packed, uint32_t bitCount) {
  static const char kDigits[] = "0123456789ABCDEF";
  const uint32_t digitCount = (bitCount + 3) / 4;
  std::string text(digitCount, '0');
  for (uint32_t d = 0; d < digitCount; ++d) {
    unsigned value = 0;
    for (uint32_t b = 0; b < 4; ++b) {
      const uint32_t bit = d * 4 + b;
      if (bit < bitCount && bit / 8 < packed.size() && ((packed[bit / 8] >> (bit % 8)) & 1u)) {
        value |= 1u << b;
      }
    }
    text[digitCount - 1 - d] = kDigits[value];
  }
  return text;
}

std::vector<uint8_t> hexToPacked(const std::string& text, uint32_t bitCount,
                                 const std::string& what) {
  std::vector<uint8_t> packed((bitCount + 7) / 8, 0);
  const size_t digitCount = text.size();
  for (size_t d = 0; d < digitCount; ++d) {
    const unsigned value =
        static_cast<unsigned>(ZinRT::Zin_NumberUtil::hexDigitValue(text[digitCount - 1 - d]));
    for (uint32_t b = 0; b < 4; ++b) {
      if (((value >> b) & 1u) == 0) continue;
      const uint64_t bit = d * 4 + b;
      if (bit >= bitCount) {
        throw UsageError(what + " " + text + " does not fit in " + std::to_string(bitCount) +
                         " bit" + (bitCount == 1 ? "" : "s"));
      }
      packed[bit / 8] = static_cast<uint8_t>(packed[bit / 8] | (1u << (bit % 8)));
    }
  }
  return packed;
}

}  // namespace zinmox
