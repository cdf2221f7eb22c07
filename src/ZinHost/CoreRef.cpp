// Parsing, checking and printing core references.
#include "ZinHost/CoreRef.h"

#include <tuple>
#include <vector>

#include "ZinHost/TextError.h"

namespace ZinHost {

namespace {

const char* const kRefHint = "expected DEVICE:CHAIN:CORE, for example 0:1:0 or 0x0:0x1:0x0";

struct Field {
  const char* what;
  uint32_t limit;
};

const Field kFields[3] = {{"device index", kMaxDeviceIndex},
                          {"user chain number", kMaxUserChainNumber},
                          {"core index", kMaxCoreIndex}};

TextError badRef(std::string_view text, const std::string& why) {
  return TextError("malformed core reference '" + quoteShort(text) + "': " + why + " (" + kRefHint +
                   ")");
}

int digitValue(char c, int base) {
  int value = -1;
  if (c >= '0' && c <= '9') value = c - '0';
  if (c >= 'a' && c <= 'f') value = c - 'a' + 10;
  if (c >= 'A' && c <= 'F') value = c - 'A' + 10;
  return value < base ? value : -1;
}

// Decimal, or hexadecimal after "0x"; at most the field's limit.
uint32_t parseField(std::string_view text, std::string_view field, const Field& kind) {
  std::string_view digits = field;
  int base = 10;
  if (digits.size() > 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) {
    digits.remove_prefix(2);
    base = 16;
  }
  const std::string what = std::string("the ") + kind.what;
  if (digits.empty()) throw badRef(text, what + " is missing");
  uint64_t value = 0;
  for (char c : digits) {
    const int digit = digitValue(c, base);
    if (digit < 0) throw badRef(text, what + " '" + quoteShort(field) + "' is not a number");
    value = value * static_cast<uint64_t>(base) + static_cast<uint64_t>(digit);
    if (value > kind.limit) break;
  }
  if (value > kind.limit) {
    throw badRef(text,
                 what + " '" + quoteShort(field) + "' is above " + std::to_string(kind.limit));
  }
  return static_cast<uint32_t>(value);
}

}  // namespace

ZIN_CORE_REF parseCoreRef(std::string_view text) {
  std::vector<std::string_view> fields;
  size_t start = 0;
  for (size_t i = 0; i <= text.size(); ++i) {
    if (i == text.size() || text[i] == ':') {
      fields.push_back(text.substr(start, i - start));
      start = i + 1;
    }
  }
  if (fields.size() != 3) throw badRef(text, "it needs three fields separated by ':'");
  return {parseField(text, fields[0], kFields[0]), parseField(text, fields[1], kFields[1]),
          parseField(text, fields[2], kFields[2])};
}

void checkCoreRef(const ZIN_CORE_REF& ref) {
  const uint32_t values[3] = {ref.deviceIndex, ref.userChainNumber, ref.coreIndex};
  for (int i = 0; i < 3; ++i) {
    if (values[i] > kFields[i].limit) {
      throw TextError("core reference " + formatCoreRef(ref) + ": the " + kFields[i].what + " " +
                      std::to_string(values[i]) + " is above " + std::to_string(kFields[i].limit));
    }
  }
}

std::string formatCoreRef(const ZIN_CORE_REF& ref) {
  return std::to_string(ref.deviceIndex) + ":" + std::to_string(ref.userChainNumber) + ":" +
         std::to_string(ref.coreIndex);
}

bool coreRefLess(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b) {
  return std::tie(a.deviceIndex, a.userChainNumber, a.coreIndex) <
         std::tie(b.deviceIndex, b.userChainNumber, b.coreIndex);
}

}  // namespace ZinHost
