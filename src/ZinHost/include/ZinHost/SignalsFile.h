// Reading signal definitions from a JSON file (--signals FILE).
#ifndef ZINHOST_SIGNALSFILE_H
#define ZINHOST_SIGNALSFILE_H

#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "ZinHost/Signals.h"

namespace ZinHost {

/// A signals file that cannot be used; the text names the file and the place of the problem.
class SignalsFileError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Reads a signals document:
///   {"signals": [{"name": "leds", "port": "async_out", "bits": [0, 1, 2, 3]},
///                {"name": "strobe", "port": "sync_out", "bits": "0"}]}
/// "bits" is an array of port bit numbers (value bit i first) or a bit-list text ("0-7"), with
/// the checks of parseBitList; with `core`, no list may name more bits than its port is wide.
/// Names pass checkSignalName. Throws SignalsFileError naming `origin` and the JSON pointer of
/// the problem.
std::vector<SignalDefinition> parseSignals(std::string_view jsonText, const std::string& origin,
                                           const ZINMOX_CORE_INFO* core = nullptr);

/// The same for a file.
std::vector<SignalDefinition> loadSignalsFile(const std::string& path,
                                              const ZINMOX_CORE_INFO* core = nullptr);

}  // namespace ZinHost

#endif
