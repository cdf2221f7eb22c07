// Hexadecimal fields of command lines.
#include "HexNumber.h"

#include "ZinRT/Zin_NumberUtil.h"

namespace ZinSim {

bool parseHexField(std::string_view text, size_t digits, uint32_t& value) {
  if (text.size() != digits) return false;
  value = 0;
  for (char c : text) {
    const int d = ZinRT::Zin_NumberUtil::hexDigitValue(c);
    if (d < 0) return false;
    value = (value << 4) | static_cast<uint32_t>(d);
  }
  return true;
}

std::string parseHexNumber(std::string_view text, uint64_t bitCount, std::vector<uint8_t>* number) {
  if (text.empty()) return "data field is empty";
  if (number != nullptr) number->assign((bitCount + 7) / 8, 0);
  for (size_t pos = 0; pos < text.size(); ++pos) {
    const int d = ZinRT::Zin_NumberUtil::hexDigitValue(text[pos]);
    if (d < 0) return "data is not hexadecimal (character " + std::to_string(pos + 1) + ")";
    const uint64_t lowBit = 4 * static_cast<uint64_t>(text.size() - 1 - pos);
    if (d == 0) continue;
    if (lowBit >= bitCount || (bitCount - lowBit < 4 && (d >> (bitCount - lowBit)) != 0)) {
      return "data does not fit in " + std::to_string(bitCount) + " bits";
    }
    if (number != nullptr) {  // a digit starts at bit 0 or 4 of a byte
      uint8_t& byte = (*number)[lowBit / 8];
      byte = static_cast<uint8_t>(byte | (d << (lowBit % 8)));
    }
  }
  return {};
}

}  // namespace ZinSim
