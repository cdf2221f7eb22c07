#include "support/WireFormat.h"

#include <gtest/gtest.h>

#include <cctype>
#include <cstdio>
#include <cstring>

namespace ZinTest {

namespace {

std::string hex8(uint32_t value) {
  char text[16];
  std::snprintf(text, sizeof text, "%08X", value);
  return text;
}

// The `n` least significant bits of a hexadecimal text, most significant first; a bad digit or
// a set bit above them is a test failure.
std::string hexToBits(const std::string& hex, std::size_t n) {
  std::string all;
  for (char c : hex) {
    const char* digits = "0123456789ABCDEF";
    const char* at = std::strchr(digits, std::toupper(static_cast<unsigned char>(c)));
    if (c == '\0' || at == nullptr) ADD_FAILURE() << "not hexadecimal: \"" << hex << "\"";
    const int digit = at != nullptr ? static_cast<int>(at - digits) : 0;
    for (int bit = 3; bit >= 0; --bit) all.push_back(((digit >> bit) & 1) ? '1' : '0');
  }
  if (all.size() < n) all.insert(0, n - all.size(), '0');
  EXPECT_EQ(all.substr(0, all.size() - n).find('1'), std::string::npos)
      << "\"" << hex << "\" has bits set above bit " << n;
  return all.substr(all.size() - n);
}

}  // namespace

std::string bitsToHex(const std::string& bits) {
  const std::string padded = std::string((4 - bits.size() % 4) % 4, '0') + bits;
  std::string hex;
  for (std::size_t i = 0; i < padded.size(); i += 4) {
    hex.push_back("0123456789ABCDEF"[std::stoi(padded.substr(i, 4), nullptr, 2)]);
  }
  return hex;
}

WriteImage WriteImage::zeros(uint32_t asyncOut, uint32_t syncOut) {
  return {std::string(asyncOut, '0'), std::vector<std::string>(syncOut, std::string(16, '0')),
          std::string(asyncOut, '0'), std::string(syncOut, '0')};
}

std::string writeDataHex(const WriteImage& image) {
  std::string bits = image.asyncValues;
  for (const std::string& steps : image.steps) bits += steps;
  return bitsToHex(bits + image.asyncUpdate + image.syncUpdate);
}

WriteImage decodeWriteCommand(const std::string& text, const std::string& prefix, uint32_t asyncOut,
                              uint32_t syncOut) {
  const std::string head = prefix + "01 0 " + hex8(2 * asyncOut + 17 * syncOut + 1) + " ";
  const std::string tail = "\n" + prefix + "02 0 00000004 0";
  const bool framed = text.size() > head.size() + tail.size() && text.rfind(head, 0) == 0 &&
                      text.substr(text.size() - tail.size()) == tail;
  if (!framed) {
    ADD_FAILURE() << "not a write sequence for " << asyncOut << "/" << syncOut << ": " << text;
    return WriteImage::zeros(asyncOut, syncOut);
  }
  const std::string data = text.substr(head.size(), text.size() - head.size() - tail.size());
  const std::string bits = hexToBits(data, 2u * asyncOut + 17u * syncOut);
  WriteImage image;
  image.asyncValues = bits.substr(0, asyncOut);
  for (uint32_t i = 0; i < syncOut; ++i) image.steps.push_back(bits.substr(asyncOut + 16 * i, 16));
  image.asyncUpdate = bits.substr(asyncOut + 16 * syncOut, asyncOut);
  image.syncUpdate = bits.substr(2 * asyncOut + 16 * syncOut);
  return image;
}

std::string readCommandText(const std::string& prefix, uint32_t asyncIn, uint32_t syncIn) {
  return prefix + "03 1 " + hex8(4 * asyncIn + 6 * syncIn + 16) + " 0\n" + prefix +
         "04 1 00000004 0";
}

uint32_t readBitCount(uint32_t asyncIn, uint32_t syncIn) {
  return 8 * ((4 * asyncIn + 6 * syncIn + 16 + 7) / 8) + 8;
}

InputImage InputImage::zeros(uint32_t asyncIn, uint32_t syncIn) {
  const std::string a(asyncIn, '0'), s(syncIn, '0');
  return {a, a, a, s, s, s, s, s};
}

InputImage InputImage::random(uint32_t asyncIn, uint32_t syncIn, std::mt19937& rng) {
  InputImage image = zeros(asyncIn, syncIn);
  for (const std::string* s : image.vectors()) {
    for (char& c : const_cast<std::string&>(*s)) c = (rng() & 1) != 0 ? '1' : '0';
  }
  return image;
}

std::vector<const std::string*> InputImage::vectors() const {
  return {&asyncValue, &asyncUp,  &asyncDown,  &syncValue,
          &syncUp,     &syncDown, &syncSyncUp, &syncSyncDown};
}

std::vector<unsigned char> readDataFor(const InputImage& image) {
  std::string bits;
  for (std::size_t i = 0; i < image.asyncValue.size(); ++i) {
    bits += {image.asyncValue[i], image.asyncUp[i], image.asyncDown[i], '1'};
  }
  for (std::size_t i = 0; i < image.syncValue.size(); ++i) {
    bits += {image.syncValue[i],  image.syncUp[i],       image.syncDown[i],
             image.syncSyncUp[i], image.syncSyncDown[i], '1'};
  }
  const uint32_t total = readBitCount(static_cast<uint32_t>(image.asyncValue.size()),
                                      static_cast<uint32_t>(image.syncValue.size()));
  std::vector<unsigned char> bytes(total / 8, 0xFF);  // junk above the input bits
  const std::size_t n = bits.size();
  for (std::size_t k = 0; k < n; ++k) {
    const std::size_t bit = n - 1 - k;
    if (bits[k] == '0') bytes[bit / 8] &= static_cast<unsigned char>(~(1u << (bit % 8)));
  }
  return bytes;
}

std::vector<uint8_t> packBits(const std::string& bits) {
  std::vector<uint8_t> bytes((bits.size() + 7) / 8, 0);
  for (std::size_t i = 0; i < bits.size(); ++i) {
    if (bits[i] == '1') bytes[i / 8] |= static_cast<uint8_t>(1u << (i % 8));
  }
  return bytes;
}

std::string unpackBits(const uint8_t* data, std::size_t n) {
  std::string bits;
  for (std::size_t i = 0; i < n; ++i) bits.push_back(((data[i / 8] >> (i % 8)) & 1) ? '1' : '0');
  return bits;
}

std::vector<uint8_t> packValue(uint64_t value, std::size_t bytes) {
  std::vector<uint8_t> out(bytes, 0);
  for (std::size_t i = 0; i < bytes && i < 8; ++i) out[i] = static_cast<uint8_t>(value >> (8 * i));
  return out;
}

void setStatusBits(std::vector<unsigned char>& word, uint32_t offset, uint32_t length,
                   uint32_t value) {
  for (uint32_t i = 0; i < length; ++i) {
    const uint32_t bit = offset + i;
    if (word.size() <= bit / 8) word.resize(bit / 8 + 1, 0);
    const auto mask = static_cast<unsigned char>(1u << (bit % 8));
    word[bit / 8] = static_cast<unsigned char>(((value >> i) & 1u) != 0 ? word[bit / 8] | mask
                                                                        : word[bit / 8] & ~mask);
  }
}

}  // namespace ZinTest
