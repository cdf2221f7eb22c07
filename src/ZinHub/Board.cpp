// The RTL model's board description.
#include "ZinHub/Board.h"

namespace ZinHub {

Board rtlModelBoard() {
  BoardDevice tap;
  tap.tapName = "zinmox.tap";
  tap.irLength = 4;
  for (uint32_t chain = 1; chain <= 4; ++chain) tap.chainInstructions[chain] = 0x7 + chain;
  Board board;
  board.devices.push_back(tap);
  return board;
}

}  // namespace ZinHub
