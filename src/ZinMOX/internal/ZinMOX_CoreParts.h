// The parts of a MOX core that only the library sees: its port image and its signal tables.
#ifndef ZINMOX_COREPARTS_H
#define ZINMOX_COREPARTS_H

#include <cstdint>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_Core.h"
#include "internal/ZinMOX_Command.h"
#include "internal/ZinMOX_SignalTable.h"

namespace ZinRT {

struct ZinMOX_Core::Parts {
  ZinMOX_Command command;
  ZinMOX_SignalTable inputSignals;   // owns its groups
  ZinMOX_SignalTable outputSignals;  // owns its groups
  // Scratch of the value-map read, kept so that a read of an unchanged core allocates nothing:
  // the suffixed keys are built in one string, the packed vectors of a signal in one buffer.
  std::string readKey;
  std::vector<uint8_t> readVectors;
};

/// The port image of a core, for the library's own checks (tests, fuzzers).
struct ZinMOX_CoreAccess {
  static const ZinMOX_Command& command(const ZinMOX_Core& core) { return core.parts->command; }
};

}  // namespace ZinRT

#endif
