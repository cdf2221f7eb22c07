// The status word of a MOX core, laid out the way the host's decoder reads it.
#include "ZinTestKit/StatusWord.h"

#include <stdexcept>
#include <string>

namespace ZinTestKit {

namespace {

// Writes `value` into `length` bits from bit `offset` (bit i is bit i mod 8 of byte i/8).
void putField(std::vector<unsigned char>& word, uint32_t offset, uint32_t length, uint32_t value,
              const char* field) {
  if (length < 32 && (value >> length) != 0) {
    throw std::invalid_argument(std::string("MOX status word: ") + field + " " +
                                std::to_string(value) + " does not fit " + std::to_string(length) +
                                " bits");
  }
  for (uint32_t i = 0; i < length; ++i) {
    if (((value >> i) & 1u) != 0) {
      const uint32_t bit = offset + i;
      word[bit / 8] = static_cast<unsigned char>(word[bit / 8] | (1u << (bit % 8)));
    }
  }
}

struct PortFields {
  uint32_t asyncIn, syncIn, asyncOut, syncOut, length;
};

void putPorts(std::vector<unsigned char>& word, const MoxStatus& s, const PortFields& at) {
  putField(word, at.asyncIn, at.length, s.asyncInputCount, "async input count");
  putField(word, at.syncIn, at.length, s.syncInputCount, "sync input count");
  putField(word, at.asyncOut, at.length, s.asyncOutputCount, "async output count");
  putField(word, at.syncOut, at.length, s.syncOutputCount, "sync output count");
}

}  // namespace

uint32_t versionKey(const MoxStatus& status) {
  return (status.majorVersion << 4) | status.minorVersion;
}

std::vector<unsigned char> buildMoxStatusWord(const MoxStatus& status) {
  std::vector<unsigned char> word(kStatusWordBytes, 0);
  const uint32_t key = versionKey(status);
  if (key >= 0xA0) {
    putField(word, 40, 4, status.qxMajorVersion, "qx major version");
    putField(word, 44, 8, status.qxMinorVersion, "qx minor version");
    putField(word, 52, 8, status.qxMinorVersionAlpha, "qx minor version alpha");
    putPorts(word, status, {60, 76, 92, 108, 16});
    return word;
  }
  // The older layouts have no qx version: anything but 0 there cannot be expressed.
  putField(word, 0, 0, status.qxMajorVersion, "qx major version");
  putField(word, 0, 0, status.qxMinorVersion, "qx minor version");
  putField(word, 0, 0, status.qxMinorVersionAlpha, "qx minor version alpha");
  if (key < 0x62) {
    putPorts(word, status, {40, 48, 56, 64, 8});
  } else {
    putPorts(word, status, {40, 56, 72, 88, 16});
  }
  return word;
}

}  // namespace ZinTestKit
