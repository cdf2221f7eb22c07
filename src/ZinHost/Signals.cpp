// Port names, signal names and the reserved whole-port names.
#include "ZinHost/Signals.h"

#include <algorithm>
#include <cctype>

#include "ZinHost/TextError.h"

namespace ZinHost {

namespace {

struct PortEntry {
  Port port;
  const char* name;
  uint32_t signalType;
  uint32_t ZINMOX_CORE_INFO::*width;
};

const PortEntry kPorts[] = {
    {Port::AsyncOut, "async_out", ZINMOX_ASYNC_OUTPUT, &ZINMOX_CORE_INFO::async_output_count},
    {Port::SyncOut, "sync_out", ZINMOX_SYNC_OUTPUT, &ZINMOX_CORE_INFO::sync_output_count},
    {Port::AsyncIn, "async_in", ZINMOX_ASYNC_INPUT, &ZINMOX_CORE_INFO::async_input_count},
    {Port::SyncIn, "sync_in", ZINMOX_SYNC_INPUT, &ZINMOX_CORE_INFO::sync_input_count}};

const PortEntry& entry(Port port) {
  return *std::find_if(std::begin(kPorts), std::end(kPorts),
                       [port](const PortEntry& e) { return e.port == port; });
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

Port parsePort(std::string_view text) {
  for (const PortEntry& e : kPorts) {
    if (text == e.name) return e.port;
  }
  throw TextError("unknown port '" + quoteShort(text) +
                  "': use async_out, sync_out, async_in or sync_in");
}

uint32_t portWidth(const ZINMOX_CORE_INFO& info, Port port) {
  return info.*entry(port).width;
}

void checkSignalName(std::string_view name, Port port) {
  if (name.find('\0') != std::string_view::npos) {
    throw TextError("a signal name must not contain a NUL character");
  }
  if (!isInput(port) && name.find_first_of(".=") != std::string_view::npos) {
    throw TextError("the signal name '" + quoteShort(name) +
                    "' holds '.' or '=', so no write could address the output");
  }
}

const std::vector<std::string>& reservedNames() {
  static const std::vector<std::string> names{"async_out_data", "sync_out_data", "async_in_data",
                                              "sync_in_data"};
  return names;
}

bool isReservedName(std::string_view name) {
  const std::string lower = lowerCase(name);
  const auto& names = reservedNames();
  return std::find(names.begin(), names.end(), lower) != names.end();
}

std::string lowerCase(std::string_view text) {
  std::string lower(text);
  std::transform(lower.begin(), lower.end(), lower.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return lower;
}

}  // namespace ZinHost
