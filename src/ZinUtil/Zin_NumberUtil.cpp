// Conversions between numbers, hexadecimal texts, bit texts and packed bit vectors. Each runs in
// one pass over its input and sizes its output once.
#include "ZinRT/Zin_NumberUtil.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <functional>
#include <stdexcept>

#include "Zin_HexDigits.h"

namespace ZinRT {

namespace {

// The reverse bit text of each byte value: character i is bit i.
constexpr std::array<std::array<char, 8>, 256> kReverseBits = [] {
  std::array<std::array<char, 8>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned i = 0; i < 8; ++i) table[b][i] = ((b >> i) & 1u) != 0 ? '1' : '0';
  }
  return table;
}();

unsigned bitValue(char c) {
  if (c == '0') return 0;
  if (c == '1') return 1;
  throw std::invalid_argument("Zin_NumberUtil::binStr2HexStr: not a bit character (code " +
                              std::to_string(static_cast<unsigned char>(c)) + ")");
}

}  // namespace

std::string& Zin_NumberUtil::uInt2DecStr(uint32_t value, std::string& out) {
  char digits[16];
  const auto result = std::to_chars(digits, digits + sizeof digits, value);
  out.assign(digits, result.ptr);
  return out;
}

std::string& Zin_NumberUtil::uInt2HexStr(uint32_t value, uint32_t widthBits, std::string& out) {
  const uint32_t digitCount = widthBits / 4;
  if (digitCount < 8 && (static_cast<uint64_t>(value) >> (4 * digitCount)) != 0) {
    throw std::out_of_range("Zin_NumberUtil::uInt2HexStr: value " + std::to_string(value) +
                            " does not fit " + std::to_string(digitCount) + " hexadecimal digits");
  }
  out.assign(digitCount, '0');
  for (uint32_t k = 0; k < digitCount && k < 8; ++k) {
    out[digitCount - 1 - k] = detail::kHexDigits[(value >> (4 * k)) & 0x0F];
  }
  return out;
}

std::string& Zin_NumberUtil::binStr2HexStr(const std::string& bits, std::string& out) {
  if (&bits == &out) {
    const std::string copy(bits);
    return binStr2HexStr(copy, out);
  }
  const size_t n = bits.size();
  const size_t digitCount = (n + 3) / 4;
  const size_t pad = 4 * digitCount - n;  // zeros that stand left of the first bit
  out.assign(digitCount, '0');
  for (size_t d = 0; d < digitCount; ++d) {
    unsigned v = 0;
    for (size_t j = 0; j < 4; ++j) {
      const size_t pos = 4 * d + j;  // position in the padded text
      v = (v << 1) | (pos < pad ? 0u : bitValue(bits[pos - pad]));
    }
    out[d] = detail::kHexDigits[v];
  }
  return out;
}

std::string& Zin_NumberUtil::hexStr2BinStr(const char* hex, uint32_t bitCount, std::string& out) {
  if (hex == nullptr) throw std::invalid_argument("Zin_NumberUtil::hexStr2BinStr: null text");
  const std::less_equal<const char*> notAfter;
  if (notAfter(out.data(), hex) && notAfter(hex, out.data() + out.size())) {
    const std::string copy(hex);  // the text lives in the output string
    return hexStr2BinStr(copy.c_str(), bitCount, out);
  }
  const size_t len = std::strlen(hex);
  std::string& bits = out;
  bits.assign(bitCount, '0');
  // Digit k from the end carries bits 4k to 4k+3 of the number; bit s lands at bitCount-1-s.
  for (size_t k = 0; k < len; ++k) {
    const unsigned v =
        static_cast<unsigned>(detail::hexValue(hex[len - 1 - k], "Zin_NumberUtil::hexStr2BinStr"));
    for (unsigned j = 0; j < 4; ++j) {
      const uint64_t s = 4 * static_cast<uint64_t>(k) + j;
      if (s < bitCount && ((v >> j) & 1u) != 0) bits[bitCount - 1 - s] = '1';
    }
  }
  return out;
}

std::string& Zin_NumberUtil::bin2ReverseBinStr(const unsigned char* data, uint32_t bitCount,
                                               std::string& out) {
  if (data == nullptr && bitCount != 0) {
    throw std::invalid_argument("Zin_NumberUtil::bin2ReverseBinStr: null data");
  }
  out.resize(bitCount);
  const uint32_t whole = bitCount / 8;
  for (uint32_t i = 0; i < whole; ++i) std::memcpy(&out[8 * i], kReverseBits[data[i]].data(), 8);
  if (bitCount % 8 != 0)
    std::memcpy(&out[8 * whole], kReverseBits[data[whole]].data(), bitCount % 8);
  return out;
}

unsigned char* Zin_NumberUtil::reverseBinStr2Bin(const std::string& bits, unsigned char* out) {
  const size_t n = bits.size();
  if (out == nullptr) {
    if (n == 0) return out;
    throw std::invalid_argument("Zin_NumberUtil::reverseBinStr2Bin: null output");
  }
  const size_t byteCount = (n + 7) / 8;
  for (size_t i = 0; i < byteCount; ++i) {
    unsigned b = 0;
    const size_t end = std::min(n, 8 * i + 8);
    for (size_t pos = 8 * i; pos < end; ++pos) b |= (bits[pos] == '1' ? 1u : 0u) << (pos - 8 * i);
    out[i] = static_cast<unsigned char>(b);
  }
  return out;
}

}  // namespace ZinRT
