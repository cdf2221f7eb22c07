// Parsing and printing core references.
#include "CoreRef.h"

#include <cstdint>
#include <tuple>
#include <vector>

#include "Errors.h"

namespace zinmox {

namespace {

const char* const kRefHint = "expected DEVICE:CHAIN:CORE, for example 0:1:0 or 0x0:0x1:0x0";

UsageError badRef(const std::string& text, const std::string& why) {
  return UsageError("malformed core reference '" + text + "': " + why + " (" + kRefHint + ")");
}

int digitValue(char c, int base) {
  int value = -1;
  if (c >= '0' && c <= '9') value = c - '0';
  if (c >= 'a' && c <= 'f') value = c - 'a' + 10;
  if (c >= 'A' && c <= 'F') value = c - 'A' + 10;
  return value < base ? value : -1;
}

// Decimal, or hexadecimal after "0x"; at most `limit`.
uint32_t parseField(const std::string& text, const std::string& field, const char* what,
                    uint32_t limit) {
  std::string digits = field;
  int base = 10;
  if (digits.size() > 2 && digits[0] == '0' && (digits[1] == 'x' || digits[1] == 'X')) {
    digits = digits.substr(2);
    base = 16;
  }
  if (digits.empty()) throw badRef(text, std::string("the ") + what + " is missing");
  uint64_t value = 0;
  for (char c : digits) {
    const int digit = digitValue(c, base);
    if (digit < 0)
      throw badRef(text, std::string("the ") + what + " '" + field + "' is not a number");
    value = value * static_cast<uint64_t>(base) + static_cast<uint64_t>(digit);
    if (value > limit) break;
  }
  if (value > limit) {
    throw badRef(text,
                 std::string("the ") + what + " '" + field + "' is above " + std::to_string(limit));
  }
  return static_cast<uint32_t>(value);
}

}  // namespace

ZIN_CORE_REF parseCoreRef(const std::string& text) {
  std::vector<std::string> fields(1);
  for (char c : text) {
    if (c == ':') {
      fields.emplace_back();
    } else {
      fields.back() += c;
    }
  }
  if (fields.size() != 3) throw badRef(text, "it needs three fields separated by ':'");
  ZIN_CORE_REF ref{};
  ref.deviceIndex = parseField(text, fields[0], "device index", 255);
  ref.userChainNumber = parseField(text, fields[1], "user chain number", 15);
  ref.coreIndex = parseField(text, fields[2], "core index", 15);
  return ref;
}

std::string formatCoreRef(const ZIN_CORE_REF& ref) {
  return std::to_string(ref.deviceIndex) + ":" + std::to_string(ref.userChainNumber) + ":" +
         std::to_string(ref.coreIndex);
}

bool coreRefLess(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b) {
  return std::tie(a.deviceIndex, a.userChainNumber, a.coreIndex) <
         std::tie(b.deviceIndex, b.userChainNumber, b.coreIndex);
}

}  // namespace zinmox
