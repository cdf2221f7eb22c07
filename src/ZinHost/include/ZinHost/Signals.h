// Ports and signal names as every client names them.
#ifndef ZINHOST_SIGNALS_H
#define ZINHOST_SIGNALS_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "ZinMOX/ZinMOX.h"

namespace ZinHost {

/// The four ports of a MOX core.
enum class Port { AsyncOut, SyncOut, AsyncIn, SyncIn };

/// "async_out", "sync_out", "async_in", "sync_in".
const char* portName(Port port);
/// The signal-type code of the define and undefine calls (ZINMOX_ASYNC_OUTPUT, ...).
uint32_t portSignalType(Port port);
bool isInput(Port port);
/// Parses a port name; throws TextError naming the valid ones.
Port parsePort(std::string_view text);
/// The width of a port in a core's information.
uint32_t portWidth(const ZINMOX_CORE_INFO& info, Port port);

/// One named signal: value bit i is port bit bits[i].
struct SignalDefinition {
  std::string name;
  Port port = Port::AsyncOut;
  std::vector<uint32_t> bits;
};

/// Checks a name for a definition on `port`. Besides the library's own rules, the clients refuse
/// a NUL character, and on the output ports a name with '.' or '=', which no write could address
/// ("NAME=HEX", "NAME.pulsetrain=HEX"). Inputs keep such names: reads report them whole. Throws
/// TextError.
void checkSignalName(std::string_view name, Port port);

/// The reserved whole-port names, one for each port of a width above 0.
const std::vector<std::string>& reservedNames();
bool isReservedName(std::string_view name);

/// Lower-case copy: signal names are case-insensitive.
std::string lowerCase(std::string_view text);

}  // namespace ZinHost

#endif
