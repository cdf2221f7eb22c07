// Value texts and packed bit vectors.
#include "ZinHost/ValueText.h"

#include "ZinHost/TextError.h"
#include "ZinRT/Zin_NumberUtil.h"

namespace ZinHost {

namespace {

unsigned digitValue(char c) {
  return static_cast<unsigned>(ZinRT::Zin_NumberUtil::hexDigitValue(c));
}

}  // namespace

std::string hexDigits(std::string_view text, const std::string& what) {
  std::string_view digits = text;
  const bool prefixed = digits.size() >= 2 && digits[0] == '0' && (digits[1] | 0x20) == 'x';
  if (prefixed) digits.remove_prefix(2);
  if (digits.empty()) {
    throw TextError(what + (prefixed ? " has no digits after 0x" : " is empty") +
                    ": give hexadecimal digits such as 3F");
  }
  for (char c : digits) {
    if (ZinRT::Zin_NumberUtil::hexDigitValue(c) < 0) {
      throw TextError(what + " '" + quoteShort(text) +
                      "' is not a hexadecimal number (digits 0-9, A-F, optionally after 0x)");
    }
  }
  return std::string(digits);
}

std::string packedToHex(std::span<const uint8_t> packed, uint64_t bitCount) {
  static const char kDigits[] = "0123456789ABCDEF";
  const uint64_t digitCount = (bitCount + 3) / 4;
  std::string text(digitCount, '0');
  for (uint64_t d = 0; d < digitCount; ++d) {
    unsigned value = 0;
    for (uint64_t b = 0; b < 4; ++b) {
      const uint64_t bit = d * 4 + b;
      if (bit < bitCount && bit / 8 < packed.size() && ((packed[bit / 8] >> (bit % 8)) & 1u)) {
        value |= 1u << b;
      }
    }
    text[digitCount - 1 - d] = kDigits[value];
  }
  return text;
}

std::vector<uint8_t> hexToPacked(std::string_view digits, uint64_t bitCount,
                                 const std::string& what) {
  std::vector<uint8_t> packed((bitCount + 7) / 8, 0);
  const size_t digitCount = digits.size();
  for (size_t d = 0; d < digitCount; ++d) {
    const unsigned value = digitValue(digits[digitCount - 1 - d]);
    for (uint64_t b = 0; b < 4; ++b) {
      if (((value >> b) & 1u) == 0) continue;
      const uint64_t bit = d * 4 + b;
      if (bit >= bitCount) {
        throw TextError(what + " " + quoteShort(digits) + " does not fit in " +
                        std::to_string(bitCount) + " bit" + (bitCount == 1 ? "" : "s"));
      }
      packed[bit / 8] = static_cast<uint8_t>(packed[bit / 8] | (1u << (bit % 8)));
    }
  }
  return packed;
}

std::vector<uint8_t> fitHexDigits(std::string_view digits, size_t bytes) {
  std::vector<uint8_t> block(bytes, 0);
  const unsigned fill = !digits.empty() && digitValue(digits[0]) >= 8 ? 0xF : 0;
  for (size_t k = 0; k < 2 * bytes; ++k) {
    const unsigned value = k < digits.size() ? digitValue(digits[digits.size() - 1 - k]) : fill;
    block[k / 2] = static_cast<uint8_t>(block[k / 2] | (value << (4 * (k % 2))));
  }
  return block;
}

}  // namespace ZinHost
