// Value-map writes with keys and texts of any bytes, on a small core with a few named signals.
// Besides the outcome checks of every call, a successful write of one plain value must stage
// exactly the bits of the fitted text, and the transfer must be well formed.
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "FuzzInput.h"
#include "FuzzSession.h"
#include "ZinMOX/ZinMOX_Core.h"
#include "ZinRT/Zin_CoreList.h"
#include "internal/ZinMOX_CoreParts.h"

using namespace ZinFuzz;

namespace {

struct Defined {
  uint32_t type;
  std::vector<uint32_t> positions;
};

int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  return -1;
}

// Value bit i of `text` fitted to `width` bits, or false when the text is not a value: the
// fitting keeps the last 2*ceil(width/8) digits or sign-extends a shorter text.
bool fittedBits(const std::string& text, uint32_t width, std::vector<int>& bits) {
  const size_t digits = 2 * ((width + 7) / 8);
  if (text.empty()) return false;
  std::string fitted;
  if (text.size() < digits) {
    const int first = digitValue(text[0]);
    if (first < 0) return false;
    fitted = std::string(digits - text.size(), first >= 8 ? 'F' : '0') + text;
  } else {
    fitted = text.substr(text.size() - digits);
  }
  bits.assign(width, 0);
  for (size_t k = 0; k < digits; ++k) {
    const int v = digitValue(fitted[digits - 1 - k]);
    if (v < 0) return false;
    for (uint32_t j = 0; j < 4; ++j) {
      if (4 * k + j < width) bits[4 * k + j] = (v >> j) & 1;
    }
  }
  return true;
}

void checkTransfer(FuzzSession& session) {
  const auto transfers = session.transport().transfers();
  if (transfers.empty()) fail("a successful write sent nothing");
  const std::string& text = transfers.back().text;
  const size_t newline = text.find('\n');
  if (newline == std::string::npos) fail("write sequence of one line: " + text);
  const size_t lastBlank = text.rfind(' ', newline);
  for (size_t i = lastBlank + 1; i < newline; ++i) {
    if (digitValue(text[i]) < 0) fail("write data not hexadecimal: " + text.substr(0, newline));
  }
}

// The staged image of a signal written alone with a plain value. A bus may name a port bit more
// than once; the last value bit staged on it is the one it holds.
void checkStaged(const ZinRT::ZinMOX_Command& image, const Defined& signal,
                 const std::vector<int>& bits) {
  std::map<uint32_t, char> expected;
  for (size_t i = 0; i < signal.positions.size(); ++i) {
    expected[signal.positions[i]] = bits[i] != 0 ? '1' : '0';
  }
  for (const auto& [p, want] : expected) {
    if (signal.type == ZINMOX_ASYNC_OUTPUT) {
      if (image.getAsyncOutValueBits()[p] != want || image.getAsyncOutUpdateBits()[p] != '1') {
        fail("asynchronous output bit " + std::to_string(p) + " staged wrong");
      }
    } else if (image.getPulseTrain(p) != std::string(16, want) ||
               image.getSyncOutUpdateBits()[p] != '1') {
      fail("synchronous output bit " + std::to_string(p) + " staged wrong");
    }
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  FuzzInput in(data, size);
  FuzzSession session;
  ZIN_CORE_REF ref{1, 2, 0};
  // Every value is read into a variable first: the order of reads must not depend on the
  // compiler's order of evaluating arguments, or a corpus would replay differently.
  const uint32_t aOut = in.below(40);
  const uint32_t sOut = in.below(40);
  const uint32_t aIn = in.below(20);
  const uint32_t sIn = in.below(20);
  session.placeCore(ref, aIn, sIn, aOut, sOut);
  session.check("ZinMOX_initCore", ZinMOX_initCore(session.handle(), &ref));

  std::map<std::string, Defined> defined;  // lower-case name to signal
  if (aOut != 0) defined["async_out_data"] = {ZINMOX_ASYNC_OUTPUT, {}};
  if (sOut != 0) defined["sync_out_data"] = {ZINMOX_SYNC_OUTPUT, {}};
  for (uint32_t i = 0; i < aOut; ++i) defined["async_out_data"].positions.push_back(i);
  for (uint32_t i = 0; i < sOut; ++i) defined["sync_out_data"].positions.push_back(i);
  static const char* const kNames[] = {"ctl", "bus", "x", "d"};
  for (uint32_t count = in.below(4); count > 0; --count) {
    const std::string name = kNames[in.below(4)];
    const uint32_t type = in.below(4);
    std::vector<uint32_t> positions(1 + in.below(12));
    for (uint32_t& p : positions) p = in.below(48);
    const uint32_t result =
        ZinMOX_defineBus(session.handle(), &ref, name.c_str(), type, positions.data(),
                         static_cast<uint32_t>(positions.size()));
    session.check("ZinMOX_defineBus", result);
    if (result == ZINMOX_SUCCESS && (type == ZINMOX_ASYNC_OUTPUT || type == ZINMOX_SYNC_OUTPUT)) {
      defined[name] = {type, positions};
    }
  }

  ZinRT::ZinMOX_ValueMap map;
  while (!in.empty() && map.size() < 8) {
    std::string key = in.text(0);
    std::string text = in.text(0);
    map[key] = std::move(text);
  }
  uintptr_t word = reinterpret_cast<uintptr_t>(&map);
  session.transport().clearLog();
  const uint32_t result = ZinMOX_writeValues(session.handle(), &ref, &word);
  session.check("ZinMOX_writeValues", result);
  if (result == ZINMOX_SUCCESS && aOut + sOut != 0) checkTransfer(session);

  if (result == ZINMOX_SUCCESS && map.size() == 1) {
    const auto& [key, text] = *map.begin();
    const auto found = defined.find(key);
    std::vector<int> bits;
    if (found != defined.end() &&
        fittedBits(text, static_cast<uint32_t>(found->second.positions.size()), bits)) {
      auto* core =
          dynamic_cast<ZinRT::ZinMOX_Core*>(ZinRT::Zin_CoreList::getCore(session.handle(), ref));
      if (core == nullptr) fail("the core is gone after a write");
      checkStaged(ZinRT::ZinMOX_CoreAccess::command(*core), found->second, bits);
    }
  }

  ZinRT::ZinMOX_ValueMap readMap;
  word = reinterpret_cast<uintptr_t>(&readMap);
  session.check("ZinMOX_readValues", ZinMOX_readValues(session.handle(), &ref, &word));
  return 0;
}
