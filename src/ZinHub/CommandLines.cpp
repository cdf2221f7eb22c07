// Reads the library's command lines for the hub transport.
#include "ZinHub/CommandLines.h"

#include <stdexcept>
#include <string>

#include "ZinRT/Zin_NumberUtil.h"

namespace ZinHub {

namespace {

int hexDigit(char c) { return ZinRT::Zin_NumberUtil::hexDigitValue(c); }

uint32_t fixedField(std::string_view field, size_t digits, const char* name) {
  uint32_t value = 0;
  bool ok = field.size() == digits;
  for (char c : field) {
    const int digit = hexDigit(c);
    ok = ok && digit >= 0;
    value = (value << 4) | static_cast<uint32_t>(digit < 0 ? 0 : digit);
  }
  if (!ok) {
    throw std::invalid_argument(std::string(name) + " field \"" + std::string(field.substr(0, 16)) +
                                "\" is not " + std::to_string(digits) + " hexadecimal digit" +
                                (digits == 1 ? "" : "s"));
  }
  return value;
}

// The hex text as bits, least significant first; digits above `width` bits must be zero.
BitVector dataBits(std::string_view text, uint32_t width, unsigned code) {
  BitVector bits(width, 0);
  size_t bit = 0;
  for (size_t i = text.size(); i-- > 0;) {
    const int digit = hexDigit(text[i]);
    if (digit < 0) throw std::invalid_argument("data is not a hexadecimal text");
    for (unsigned b = 0; b < 4; ++b, ++bit) {
      if (((digit >> b) & 1) == 0) continue;
      if (bit >= width) {
        throw std::invalid_argument(code == 1 ? "data does not fit in bit length - 1 bits"
                                              : "data must be 0 for code 0" + std::to_string(code));
      }
      bits[bit] = 1;
    }
  }
  return bits;
}

std::vector<std::string_view> splitFields(std::string_view line) {
  std::vector<std::string_view> fields;
  size_t start = 0;
  while (true) {
    const size_t blank = line.find(' ', start);
    fields.push_back(line.substr(start, blank == std::string_view::npos ? blank : blank - start));
    if (blank == std::string_view::npos || fields.size() > 7) break;
    start = blank + 1;
  }
  return fields;
}

void checkLength(const HubLine& line) {
  const bool ok = line.code == 1   ? line.bitLength >= 1 && line.bitLength <= kMaxLineBits
                  : line.code == 3 ? line.bitLength >= 16 && line.bitLength <= kMaxLineBits
                                   : line.bitLength == 4;
  if (!ok) {
    throw std::invalid_argument("bit length " + std::to_string(line.bitLength) +
                                " is not possible for code 0" + std::to_string(line.code));
  }
}

void checkBoard(const ZIN_CORE_REF& ref, const Board& board) {
  if (ref.deviceIndex >= board.devices.size()) {
    throw std::invalid_argument("no device " + std::to_string(ref.deviceIndex) + " on the board");
  }
  if (board.devices[ref.deviceIndex].chainInstructions.count(ref.userChainNumber) == 0) {
    throw std::invalid_argument("device " + std::to_string(ref.deviceIndex) +
                                " has no user chain " + std::to_string(ref.userChainNumber));
  }
}

HubLine parseLine(std::string_view text, const Board& board) {
  const std::vector<std::string_view> f = splitFields(text);
  if (f.size() != 7) throw std::invalid_argument("expected 7 fields separated by single blanks");
  for (std::string_view field : f) {
    if (field.empty()) throw std::invalid_argument("a field is empty");
  }
  HubLine line;
  line.ref.deviceIndex = fixedField(f[0], 2, "device");
  line.ref.userChainNumber = fixedField(f[1], 1, "user chain");
  line.ref.coreIndex = fixedField(f[2], 1, "core");
  checkBoard(line.ref, board);
  line.code = fixedField(f[3], 2, "code");
  if (line.code < 1 || line.code > 4) throw std::invalid_argument("unknown command code");
  const char flag = line.code >= 3 ? '1' : '0';
  if (f[4].size() != 1 || f[4][0] != flag) {
    throw std::invalid_argument(std::string("read flag must be ") + flag + " for code 0" +
                                std::to_string(line.code));
  }
  line.bitLength = fixedField(f[5], 8, "bit length");
  checkLength(line);
  line.data = dataBits(f[6], line.code == 1 ? line.bitLength - 1 : 0, line.code);
  if (line.code == 1) line.data.push_back(0);
  return line;
}

}  // namespace

std::vector<HubLine> parseHubLines(std::string_view text, const Board& board, size_t readBytes) {
  std::vector<HubLine> lines;
  size_t start = 0;
  size_t offset = 0;
  uint64_t totalBits = 0;
  for (size_t number = 1;; ++number) {
    const size_t end = text.find('\n', start);
    const std::string_view line =
        text.substr(start, end == std::string_view::npos ? end : end - start);
    try {
      lines.push_back(parseLine(line, board));
      totalBits += lines.back().bitLength;
      if (totalBits > kMaxSequenceBits) {
        throw std::invalid_argument("the sequence moves more than " +
                                    std::to_string(kMaxSequenceBits) + " bits");
      }
      if (lines.back().code >= 3) {
        lines.back().readOffset = offset;
        offset += (size_t{lines.back().bitLength} + 7) / 8;
        if (offset > readBytes)
          throw std::invalid_argument("the read data does not fit the buffer");
      }
    } catch (const std::invalid_argument& e) {
      throw std::runtime_error("ZinHub: command line " + std::to_string(number) + ": " + e.what());
    }
    if (end == std::string_view::npos) break;
    start = end + 1;
  }
  return lines;
}

}  // namespace ZinHub
