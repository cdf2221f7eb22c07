// Reading signal definitions from a JSON file (--signals FILE).
#ifndef ZINMOX_TOOL_SIGNALSFILE_H
#define ZINMOX_TOOL_SIGNALSFILE_H

#include <string>
#include <string_view>
#include <vector>

#include "Signals.h"

namespace zinmox {

/// Reads a signals document:
///   {"signals": [{"name": "leds", "port": "async_out", "bits": [0, 1, 2, 3]},
///                {"name": "strobe", "port": "sync_out", "bits": "0"}]}
/// "bits" is an array of port bit numbers (value bit i first) or a bit-list text ("0-7").
/// Throws Failure naming `origin` and the JSON pointer of the problem.
std::vector<SignalDefinition> parseSignals(std::string_view jsonText, const std::string& origin);

/// The same for a file.
std::vector<SignalDefinition> loadSignalsFile(const std::string& path);

}  // namespace zinmox

#endif
