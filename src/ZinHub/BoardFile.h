// Board descriptions as JSON (docs/hardware.md): per device, the debugger's TAP name, the IR
// length, the instruction of each user chain, the wait bits and an optional expected IDCODE.
#ifndef ZINHUB_BOARDFILE_H
#define ZINHUB_BOARDFILE_H

#include <stdexcept>
#include <string>

#include "ZinHub/Board.h"

namespace ZinHub {

/// A board description that cannot be used; the text names the place ("devices[0].chains.5").
class BoardError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Largest board file read, in bytes.
constexpr size_t kMaxBoardFileBytes = 1 << 20;

/// The presets: "rtl-model" (the default), "xilinx-7series" (USER1-USER4) and "ecp5" (ER1, ER2).
/// Throws BoardError for an unknown name.
Board presetBoard(const std::string& name);

/// Reads a board description from JSON text. `origin` names it in errors.
Board parseBoard(const std::string& json, const std::string& origin);

/// "" is the RTL model's board; a preset name is that preset; text starting with '{' is JSON;
/// anything else is the path of a JSON file.
Board loadBoard(const std::string& textOrPath);

}  // namespace ZinHub

#endif
