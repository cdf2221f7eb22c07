// Port names, bit lists and the reserved whole-port names.
#include "Signals.h"

#include <algorithm>
#include <cctype>

#include "Errors.h"
#include "ZinMOX/ZinMOX.h"

namespace zinmox {

namespace {

struct PortEntry {
  Port port;
  const char* name;
  uint32_t signalType;
};

const PortEntry kPorts[] = {{Port::AsyncOut, "async_out", ZINMOX_ASYNC_OUTPUT},
                            {Port::SyncOut, "sync_out", ZINMOX_SYNC_OUTPUT},
                            {Port::AsyncIn, "async_in", ZINMOX_ASYNC_INPUT},
                            {Port::SyncIn, "sync_in", ZINMOX_SYNC_INPUT}};

const PortEntry& entry(Port port) {
  return *std::find_if(std::begin(kPorts), std::end(kPorts),
                       [port](const PortEntry& e) { return e.port == port; });
}

// A decimal bit number of the bit list `text`.
uint32_t parseBit(const std::string& text, const std::string& field) {
  if (field.empty() || field.size() > 9 ||
      !std::all_of(field.begin(), field.end(), [](unsigned char c) { return std::isdigit(c); })) {
    throw UsageError("bad bit list '" + text + "': '" + field +
                     "' is not a bit number (use forms like 0-7, 3 or 0,2,4)");
  }
  return static_cast<uint32_t>(std::stoul(field));
}

void appendRange(const std::string& text, const std::string& item, std::vector<uint32_t>& bits) {
  const auto dash = item.find('-');
  if (dash == std::string::npos) {
    bits.push_back(parseBit(text, item));
    return;
  }
  const uint32_t from = parseBit(text, item.substr(0, dash));
  const uint32_t to = parseBit(text, item.substr(dash + 1));
  if ((from > to ? from - to : to - from) >= 65536) {
    throw UsageError("bad bit list '" + text + "': the range " + item + " is longer than a port");
  }
  for (uint32_t bit = from;; bit = from < to ? bit + 1 : bit - 1) {
    bits.push_back(bit);
    if (bit == to) break;
  }
}

}  // namespace

const char* portName(Port port) {
  return entry(port).name;
}

uint32_t portSignalType(Port port) {
  return entry(port).signalType;
}

bool isInput(Port port) {
  return port == Port::AsyncIn || port == Port::SyncIn;
}

Port parsePort(const std::string& text) {
  for (const PortEntry& e : kPorts) {
    if (text == e.name) return e.port;
  }
  throw UsageError("unknown port '" + text + "': use async_out, sync_out, async_in or sync_in");
}

std::vector<uint32_t> parseBitList(const std::string& text) {
  std::vector<uint32_t> bits;
  std::string item;
  for (size_t i = 0; i <= text.size(); ++i) {
    if (i == text.size() || text[i] == ',') {
      appendRange(text, item, bits);
      item.clear();
    } else {
      item += text[i];
    }
  }
  return bits;
}

std::string formatBitList(const std::vector<uint32_t>& bits) {
  std::string text;
  size_t i = 0;
  while (i < bits.size()) {
    size_t j = i;
    const int step = (i + 1 < bits.size() && bits[i + 1] + 1 == bits[i]) ? -1 : 1;
    while (j + 1 < bits.size() && static_cast<int64_t>(bits[j + 1]) - bits[j] == step) ++j;
    if (!text.empty()) text += ",";
    text += std::to_string(bits[i]);
    if (j > i) {
      text += '-';
      text += std::to_string(bits[j]);
    }
    i = j + 1;
  }
  return text;
}

const std::vector<std::string>& reservedNames() {
  static const std::vector<std::string> names{"async_out_data", "sync_out_data", "async_in_data",
                                              "sync_in_data"};
  return names;
}

bool isReservedName(const std::string& name) {
  const std::string lower = lowerCase(name);
  const auto& names = reservedNames();
  return std::find(names.begin(), names.end(), lower) != names.end();
}

std::string lowerCase(const std::string& text) {
  std::string lower = text;
  std::transform(lower.begin(), lower.end(), lower.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return lower;
}

}  // namespace zinmox
