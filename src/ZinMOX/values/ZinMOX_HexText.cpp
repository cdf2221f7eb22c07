// Fitting and parsing of hexadecimal value texts.
#include "values/ZinMOX_HexText.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>
#include <string>

#include "format/ZinMOX_BitFormat.h"

namespace ZinRT::mox {

namespace {

[[noreturn]] void failInvalid(const std::string& text) {
  throw std::logic_error("Invalid Hex String: " + text);
}

}  // namespace

uint32_t parseHexString(const char* text) {
  const char* digit = text;
  if (digit[0] == '0' && (digit[1] == 'x' || digit[1] == 'X')) digit += 2;
  uint32_t value = 0;
  for (; *digit != '\0'; ++digit) {
    const int digitValue = hexDigitValue(*digit);
    if (digitValue < 0) failInvalid(text);
    value = (value << 4) | static_cast<uint32_t>(digitValue);
  }
  return value;
}

FittedHex fitHexString(const char* text, int32_t bitWidth) {
  // An empty (or absent) text has no digit to take the sign from: it is not a value.
  if (text == nullptr || text[0] == '\0') failInvalid("");
  const uint32_t width = bitWidth > 0 ? static_cast<uint32_t>(bitWidth) : 0;
  const size_t digits = 2 * static_cast<size_t>(byteCount(width));
  const size_t length = std::strlen(text);
  FittedHex fitted{'0', 0, text + (length - std::min(length, digits)), std::min(length, digits)};
  if (length < digits) {
    const char first[2] = {text[0], '\0'};
    fitted.fill = parseHexString(first) >= 8 ? 'F' : '0';
    fitted.fillCount = digits - length;
  }
  if (!allHexDigits(fitted.kept, fitted.keptCount)) failInvalid(text);
  return fitted;
}

void fittedToBin(const FittedHex& fitted, size_t first, size_t last, Zin_ByteBuffer& scratch,
                 Zin_ByteBuffer& out) {
  if (first > last || last >= fitted.size()) {
    throw std::logic_error("fittedToBin(): digits " + std::to_string(first) + " to " +
                           std::to_string(last) + " are not inside a fitted text of " +
                           std::to_string(fitted.size()) + " digits");
  }
  const size_t count = last - first + 1;
  if (first >= fitted.fillCount) {
    Zin_ByteBuffer::hexDigits2Bin(fitted.kept + (first - fitted.fillCount),
                                  static_cast<uint32_t>(count), out);
    return;
  }
  scratch.resize(static_cast<uint32_t>(count));
  char* text = scratch.ptr();
  const size_t fills = std::min(fitted.fillCount, last + 1) - first;
  std::memset(text, fitted.fill, fills);
  std::memcpy(text + fills, fitted.kept, count - fills);
  Zin_ByteBuffer::hexDigits2Bin(text, static_cast<uint32_t>(count), out);
}

}  // namespace ZinRT::mox
