// Digit tables shared by the conversions of the utility library (internal).
#ifndef ZINUTIL_ZIN_HEXDIGITS_H
#define ZINUTIL_ZIN_HEXDIGITS_H

#include <array>
#include <cstdint>

namespace ZinRT::detail {

/// Upper-case hexadecimal digits by value.
inline constexpr char kHexDigits[] = "0123456789ABCDEF";

/// Value of a hexadecimal digit by character, or -1 for any other character.
inline constexpr std::array<int8_t, 256> kHexValues = [] {
  std::array<int8_t, 256> table{};
  for (auto& v : table) v = -1;
  for (int i = 0; i < 10; ++i) table['0' + i] = static_cast<int8_t>(i);
  for (int i = 0; i < 6; ++i) {
    table['A' + i] = static_cast<int8_t>(10 + i);
    table['a' + i] = static_cast<int8_t>(10 + i);
  }
  return table;
}();

/// The value of hexadecimal digit `c`; throws std::invalid_argument naming `where` and the
/// character otherwise.
int hexValue(char c, const char* where);

}  // namespace ZinRT::detail

#endif
