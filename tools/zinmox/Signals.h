// Signal definitions as the tool knows them: a name, a port and the port bits of each value bit.
#ifndef ZINMOX_TOOL_SIGNALS_H
#define ZINMOX_TOOL_SIGNALS_H

#include <cstdint>
#include <string>
#include <vector>

namespace zinmox {

/// The four ports of a MOX core, by the names the tool uses for them.
enum class Port { AsyncOut, SyncOut, AsyncIn, SyncIn };

/// "async_out", "sync_out", "async_in", "sync_in".
const char* portName(Port port);
/// The signal-type code of the define and undefine calls (ZINMOX_ASYNC_OUTPUT, ...).
uint32_t portSignalType(Port port);
bool isInput(Port port);
/// Parses a port name; throws UsageError naming the valid ones.
Port parsePort(const std::string& text);

/// One named signal: value bit i is port bit bits[i].
struct SignalDefinition {
  std::string name;
  Port port = Port::AsyncOut;
  std::vector<uint32_t> bits;
};

/// Parses a bit list such as "0-7", "3", "0,2,4" or "7-0" (a descending range lists the bits
/// from high to low). Throws UsageError.
std::vector<uint32_t> parseBitList(const std::string& text);

/// "0-7", "3", "0,2,4": the shortest text that parseBitList reads back as `bits`.
std::string formatBitList(const std::vector<uint32_t>& bits);

/// The reserved whole-port names that every initialised core has.
const std::vector<std::string>& reservedNames();
bool isReservedName(const std::string& name);

/// Lower-case copy: signal names are case-insensitive.
std::string lowerCase(const std::string& text);

}  // namespace zinmox

#endif
