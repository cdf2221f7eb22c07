// What the hub transport knows about a board: the TAPs on its scan chain and, per TAP, the
// instruction that selects each user chain and how long a hub may take to answer.
#ifndef ZINHUB_BOARD_H
#define ZINHUB_BOARD_H

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "ZinHub/HubCodec.h"

namespace ZinHub {

struct BoardDevice {
  std::string tapName;                             // for people and debuggers ("zinmox.tap")
  uint32_t irLength = 4;                           // bits in the TAP's instruction register
  std::map<uint32_t, uint64_t> chainInstructions;  // user chain number -> instruction
  unsigned waitBits = kDefaultWaitBits;            // W: TCK cycles a hub may take to answer
};

/// Device index i is `devices[i]`, counted along the chain.
struct Board {
  std::vector<BoardDevice> devices;
};

/// The RTL model's board: one TAP with IR length 4 and user chains 1 to 4 on instructions 0x8
/// to 0xB; W = 64.
Board rtlModelBoard();

}  // namespace ZinHub

#endif
