#include "support/WireFormat.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <sstream>

namespace ZinTest {

namespace {

int hexDigitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

std::string hex8(uint32_t value) {
  char text[16];
  std::snprintf(text, sizeof text, "%08X", value);
  return text;
}

}  // namespace

std::vector<std::string> splitLines(const std::string& text) {
  std::vector<std::string> lines;
  std::size_t start = 0;
  for (;;) {
    std::size_t end = text.find('\n', start);
    lines.push_back(text.substr(start, end == std::string::npos ? std::string::npos : end - start));
    if (end == std::string::npos) break;
    start = end + 1;
  }
  return lines;
}

CommandLine parseLine(const std::string& line) {
  std::vector<std::string> fields;
  std::size_t start = 0;
  for (;;) {
    std::size_t end = line.find(' ', start);
    fields.push_back(
        line.substr(start, end == std::string::npos ? std::string::npos : end - start));
    if (end == std::string::npos) break;
    start = end + 1;
  }
  bool wellFormed = fields.size() == 7;
  for (const std::string& field : fields) wellFormed = wellFormed && !field.empty();
  if (!wellFormed) {
    ADD_FAILURE() << "malformed command line: \"" << line << "\"";
    return {};
  }
  return {fields[0], fields[1], fields[2], fields[3], fields[4], fields[5], fields[6]};
}

std::string hexToBits(const std::string& hex, std::size_t n) {
  std::string all;
  for (char c : hex) {
    int digit = hexDigitValue(c);
    if (digit < 0) {
      ADD_FAILURE() << "not a hexadecimal text: \"" << hex << "\"";
      return std::string(n, '?');
    }
    for (int bit = 3; bit >= 0; --bit) all.push_back(((digit >> bit) & 1) ? '1' : '0');
  }
  if (all.size() < n) all.insert(0, n - all.size(), '0');
  std::string high = all.substr(0, all.size() - n);
  if (high.find('1') != std::string::npos) {
    ADD_FAILURE() << "hexadecimal text \"" << hex << "\" has bits set above bit " << n;
  }
  return all.substr(all.size() - n);
}

std::string bitsToHex(const std::string& bits) {
  std::string padded = std::string((4 - bits.size() % 4) % 4, '0') + bits;
  std::string hex;
  for (std::size_t i = 0; i < padded.size(); i += 4) {
    int digit = 0;
    for (std::size_t j = 0; j < 4; ++j) digit = digit * 2 + (padded[i + j] == '1' ? 1 : 0);
    hex.push_back("0123456789ABCDEF"[digit]);
  }
  return hex;
}

WriteImage WriteImage::zeros(uint32_t asyncOut, uint32_t syncOut) {
  WriteImage image;
  image.asyncValues.assign(asyncOut, '0');
  image.steps.assign(syncOut, std::string(16, '0'));
  image.asyncUpdate.assign(asyncOut, '0');
  image.syncUpdate.assign(syncOut, '0');
  return image;
}

std::string writeBits(const WriteImage& image) {
  std::string bits = image.asyncValues;
  for (const std::string& steps : image.steps) bits += steps;
  return bits + image.asyncUpdate + image.syncUpdate;
}

std::string writeDataHex(const WriteImage& image) {
  return bitsToHex(writeBits(image));
}

WriteImage decodeWriteData(const std::string& dataHex, uint32_t asyncOut, uint32_t syncOut) {
  std::string bits = hexToBits(dataHex, 2u * asyncOut + 17u * syncOut);
  WriteImage image;
  std::size_t pos = 0;
  image.asyncValues = bits.substr(pos, asyncOut);
  pos += asyncOut;
  for (uint32_t i = 0; i < syncOut; ++i, pos += 16) image.steps.push_back(bits.substr(pos, 16));
  image.asyncUpdate = bits.substr(pos, asyncOut);
  pos += asyncOut;
  image.syncUpdate = bits.substr(pos, syncOut);
  return image;
}

WriteImage decodeWriteCommand(const std::string& text, const std::string& prefix, uint32_t asyncOut,
                              uint32_t syncOut) {
  std::vector<std::string> lines = splitLines(text);
  if (lines.size() != 2) {
    ADD_FAILURE() << "a write sequence has two lines: \"" << text << "\"";
    return WriteImage::zeros(asyncOut, syncOut);
  }
  const std::string head = prefix + "01 0 " + hex8(2 * asyncOut + 17 * syncOut + 1) + " ";
  EXPECT_EQ(lines[0].substr(0, head.size()), head) << text;
  EXPECT_EQ(lines[1], prefix + "02 0 00000004 0") << text;
  CommandLine line = parseLine(lines[0]);
  return decodeWriteData(line.data, asyncOut, syncOut);
}

std::string readCommandText(const std::string& prefix, uint32_t asyncIn, uint32_t syncIn) {
  return prefix + "03 1 " + hex8(4 * asyncIn + 6 * syncIn + 16) + " 0\n" + prefix +
         "04 1 00000004 0";
}

uint32_t readBitCount(uint32_t asyncIn, uint32_t syncIn) {
  uint32_t length = 4 * asyncIn + 6 * syncIn + 16;
  return 8 * ((length + 7) / 8) + 8;
}

InputImage InputImage::zeros(uint32_t asyncIn, uint32_t syncIn) {
  InputImage image;
  for (std::string* s : {&image.asyncValue, &image.asyncUp, &image.asyncDown}) {
    s->assign(asyncIn, '0');
  }
  for (std::string* s :
       {&image.syncValue, &image.syncUp, &image.syncDown, &image.syncSyncUp, &image.syncSyncDown}) {
    s->assign(syncIn, '0');
  }
  return image;
}

InputImage InputImage::random(uint32_t asyncIn, uint32_t syncIn, std::mt19937& rng) {
  InputImage image = zeros(asyncIn, syncIn);
  std::bernoulli_distribution coin(0.5);
  for (std::string* s : {&image.asyncValue, &image.asyncUp, &image.asyncDown, &image.syncValue,
                         &image.syncUp, &image.syncDown, &image.syncSyncUp, &image.syncSyncDown}) {
    for (char& c : *s) c = coin(rng) ? '1' : '0';
  }
  return image;
}

std::string inputBits(const InputImage& image, char unused) {
  std::string bits;
  for (uint32_t i = 0; i < image.asyncCount(); ++i) {
    bits += {image.asyncValue[i], image.asyncUp[i], image.asyncDown[i], unused};
  }
  for (uint32_t i = 0; i < image.syncCount(); ++i) {
    bits += {image.syncValue[i],  image.syncUp[i],       image.syncDown[i],
             image.syncSyncUp[i], image.syncSyncDown[i], unused};
  }
  return bits;
}

std::vector<unsigned char> readDataFor(const std::string& bits, uint32_t readBits, bool junkAbove) {
  std::vector<unsigned char> bytes((readBits + 7) / 8, 0);
  const std::size_t n = bits.size();
  for (std::size_t k = 0; k < n; ++k) {
    if (bits[k] != '1') continue;
    std::size_t bit = n - 1 - k;
    bytes[bit / 8] |= static_cast<unsigned char>(1u << (bit % 8));
  }
  if (junkAbove) {
    for (std::size_t bit = n; bit < bytes.size() * 8; ++bit) {
      bytes[bit / 8] |= static_cast<unsigned char>(1u << (bit % 8));
    }
  }
  return bytes;
}

std::vector<unsigned char> readDataFor(const InputImage& image) {
  return readDataFor(inputBits(image, '1'), readBitCount(image.asyncCount(), image.syncCount()),
                     true);
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
    uint32_t bit = offset + i;
    if (word.size() <= bit / 8) word.resize(bit / 8 + 1, 0);
    auto mask = static_cast<unsigned char>(1u << (bit % 8));
    if ((value >> i) & 1u) {
      word[bit / 8] |= mask;
    } else {
      word[bit / 8] &= static_cast<unsigned char>(~mask);
    }
  }
}

}  // namespace ZinTest
