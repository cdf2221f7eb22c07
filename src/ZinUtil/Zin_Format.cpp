// Checked decoding of one hexadecimal digit.
#include "Zin_Format.h"

#include <stdexcept>
#include <string>

namespace ZinRT::detail {

int hexValue(char c, const char* where) {
  const int v = kHexValues[static_cast<unsigned char>(c)];
  if (v < 0) {
    const auto code = static_cast<unsigned>(static_cast<unsigned char>(c));
    throw std::invalid_argument(std::string(where) + ": not a hexadecimal digit (character code " +
                                std::to_string(code) + ")");
  }
  return v;
}

}  // namespace ZinRT::detail
