// Fitting and parsing of hexadecimal value texts.
#include "values/ZinMOX_HexText.h"

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

std::unique_ptr<Zin_ByteBuffer> fitHexString(const char* text, int32_t bitWidth) {
  // An empty (or absent) text has no digit to take the sign from: it is not a value.
  if (text == nullptr || text[0] == '\0') failInvalid("");
  const uint32_t width = bitWidth > 0 ? static_cast<uint32_t>(bitWidth) : 0;
  const size_t digits = 2 * static_cast<size_t>(byteCount(width));
  const size_t length = std::strlen(text);

  auto fitted = std::make_unique<Zin_ByteBuffer>(static_cast<uint32_t>(digits + 1), 0, 0);
  char* out = fitted->ptr();
  if (length < digits) {
    const char first[2] = {text[0], '\0'};
    const char fill = parseHexString(first) >= 8 ? 'F' : '0';
    std::memset(out, fill, digits - length);
    std::memcpy(out + (digits - length), text, length);
  } else {
    std::memcpy(out, text + (length - digits), digits);
  }
  out[digits] = '\0';
  if (!allHexDigits(out, digits)) failInvalid(text);
  return fitted;
}

}  // namespace ZinRT::mox
