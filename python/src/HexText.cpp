// Conversions between hex texts and little-endian byte blocks.
#include "HexText.h"

#include "ZinRT/Zin_NumberUtil.h"

#include <stdexcept>

namespace zinmox {

std::string hexText(const std::string& bytes, size_t digits) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  std::string text(digits, '0');
  const size_t filled = std::min(digits, 2 * bytes.size());
  for (size_t k = 0; k < filled; ++k) {
    const auto byte = static_cast<unsigned char>(bytes[k / 2]);
    text[digits - 1 - k] = kDigits[k % 2 == 0 ? (byte & 0x0F) : (byte >> 4)];
  }
  return text;
}

std::string fitHexText(const std::string& text, size_t bytes) {
  const size_t digits = 2 * bytes;
  if (text.empty() || ZinRT::Zin_NumberUtil::hexDigitValue(text[0]) < 0) {
    throw std::invalid_argument("invalid hex text \"" + text + "\"");
  }
  std::string fitted =
      text.size() >= digits
          ? text.substr(text.size() - digits)
          : std::string(digits - text.size(),
                        ZinRT::Zin_NumberUtil::hexDigitValue(text[0]) >= 8 ? 'F' : '0') +
                text;
  std::string block(bytes, '\0');
  for (size_t k = 0; k < digits; ++k) {
    const int value = ZinRT::Zin_NumberUtil::hexDigitValue(fitted[digits - 1 - k]);
    if (value < 0) throw std::invalid_argument("invalid hex text \"" + text + "\"");
    block[k / 2] =
        static_cast<char>(static_cast<unsigned char>(block[k / 2]) | (value << (4 * (k % 2))));
  }
  return block;
}

}  // namespace zinmox
