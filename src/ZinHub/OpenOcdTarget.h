// The target text of a board behind OpenOCD:
//
//   openocd://HOST:PORT[?board=BOARD][&timeout=MS]
//
// HOST:PORT is OpenOCD's Tcl server; BOARD a preset name or the path of a board file
// (docs/hardware.md; default: the RTL model's board); MS bounds connecting and every request.
#ifndef ZINHUB_OPENOCDTARGET_H
#define ZINHUB_OPENOCDTARGET_H

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "ZinHub/HubTransport.h"
#include "ZinHub/OpenOcdEngine.h"

namespace ZinHub {

struct OpenOcdTarget {
  std::string host;
  uint16_t port = 0;
  std::string board;       // as loadBoard takes it
  uint32_t timeoutMs = 0;  // 0: the defaults of OpenOcdOptions
};

/// Nothing when `text` does not start with "openocd://"; throws std::invalid_argument when it
/// does but is malformed.
std::optional<OpenOcdTarget> parseOpenOcdTarget(const std::string& text);

/// "OpenOCD at HOST:PORT"
std::string describeOpenOcdTarget(const OpenOcdTarget& target);

/// The hub transport over OpenOCD, connected and checked against the board. Throws BoardError
/// for a bad board and std::runtime_error when OpenOCD cannot be reached or does not match.
std::shared_ptr<HubTransport> openOpenOcd(const OpenOcdTarget& target);

}  // namespace ZinHub

#endif
