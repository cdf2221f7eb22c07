// Conversions between numbers, hexadecimal texts, bit texts and packed bit vectors. Each runs in
// one pass over its input and sizes its output once.
#include "ZinRT/Zin_NumberUtil.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <functional>
#include <stdexcept>

#include "Zin_Format.h"

namespace ZinRT {

namespace {

unsigned bitValue(char c) {
  if (c == '0') return 0;
  if (c == '1') return 1;
  throw std::invalid_argument("Zin_NumberUtil::binStr2HexStr: not a bit character (code " +
                              std::to_string(static_cast<unsigned char>(c)) + ")");
}

// The value of `count` bit characters, most significant first; throws on the first bad one.
unsigned bitsValue(const char* bits, size_t count) {
  unsigned v = 0;
  for (size_t j = 0; j < count; ++j) v = (v << 1) | bitValue(bits[j]);
  return v;
}

// Eight bit characters as a byte, most significant first; throws on the first bad one.
unsigned bitByte(const char* bits) {
  const uint64_t word = detail::loadWord(bits);
  if (detail::isBitWord(word)) return detail::bitWordMsbFirst(word);
  return bitsValue(bits, 8);
}

}  // namespace

int Zin_NumberUtil::hexDigitValue(char c) {
  return detail::kHexValues[static_cast<unsigned char>(c)];
}

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
  out.resize(digitCount);
  const char* in = bits.data();
  char* digits = out.data();
  // The text is padded with zeros on the left to whole digits: the first digit takes the
  // leading n mod 4 characters, every further digit four.
  const size_t head = n % 4;
  size_t pos = 0;
  if (head != 0) {
    *digits++ = detail::kHexDigits[bitsValue(in, head)];
    pos = head;
  }
  for (; pos + 8 <= n; pos += 8, digits += 2)
    std::memcpy(digits, detail::kByteDigits[bitByte(in + pos)].data(), 2);
  if (pos < n) *digits = detail::kHexDigits[bitsValue(in + pos, 4)];
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
  // Every digit is checked, also those above the kept bits, the least significant first.
  for (size_t k = len; k-- > 0;) {
    if (detail::kHexValues[static_cast<unsigned char>(hex[k])] < 0) {
      detail::hexValue(hex[k], "Zin_NumberUtil::hexStr2BinStr");
    }
  }
  out.assign(bitCount, '0');
  // Digit k from the end carries bits 4k to 4k+3 of the number; bit s lands at bitCount-1-s, so
  // the digit's four characters end at bitCount-4k.
  char* bits = out.data();
  const size_t whole = std::min<size_t>(len, bitCount / 4);
  for (size_t k = 0; k < whole; ++k) {
    const auto v =
        static_cast<unsigned>(detail::kHexValues[static_cast<unsigned char>(hex[len - 1 - k])]);
    std::memcpy(bits + bitCount - 4 * (k + 1), detail::kDigitBits[v].data(), 4);
  }
  const size_t part = bitCount % 4;
  if (whole < len && part != 0) {
    const auto v =
        static_cast<unsigned>(detail::kHexValues[static_cast<unsigned char>(hex[len - 1 - whole])]);
    std::memcpy(bits, detail::kDigitBits[v].data() + (4 - part), part);
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
  for (uint32_t i = 0; i < whole; ++i)
    std::memcpy(&out[8 * i], detail::kByteBitsLsbFirst[data[i]].data(), 8);
  if (bitCount % 8 != 0)
    std::memcpy(&out[8 * whole], detail::kByteBitsLsbFirst[data[whole]].data(), bitCount % 8);
  return out;
}

unsigned char* Zin_NumberUtil::reverseBinStr2Bin(const std::string& bits, unsigned char* out) {
  const size_t n = bits.size();
  if (out == nullptr) {
    if (n == 0) return out;
    throw std::invalid_argument("Zin_NumberUtil::reverseBinStr2Bin: null output");
  }
  const char* in = bits.data();
  const size_t whole = n / 8;
  size_t i = 0;
  for (; i + 2 <= whole; i += 2) {
    const unsigned ones = detail::onesLsbFirst16(in + 8 * i);
    out[i] = static_cast<unsigned char>(ones);
    out[i + 1] = static_cast<unsigned char>(ones >> 8);
  }
  for (; i < whole; ++i) {
    out[i] = static_cast<unsigned char>(detail::onesWordLsbFirst(detail::loadWord(in + 8 * i)));
  }
  if (n % 8 != 0) {
    unsigned b = 0;
    for (size_t pos = 8 * whole; pos < n; ++pos)
      b |= (in[pos] == '1' ? 1u : 0u) << (pos - 8 * whole);
    out[whole] = static_cast<unsigned char>(b);
  }
  return out;
}

}  // namespace ZinRT
