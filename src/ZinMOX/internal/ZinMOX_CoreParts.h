// The parts of a MOX core that only the library sees: its port image and its signal tables.
#ifndef ZINMOX_COREPARTS_H
#define ZINMOX_COREPARTS_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_Core.h"
#include "ZinRT/Zin_ByteBuffer.h"
#include "internal/ZinMOX_Command.h"
#include "internal/ZinMOX_SignalTable.h"

namespace ZinRT {

/// An input signal as the value-map read reports it: the value map's hash of each key it goes
/// under (its name, then the name with each suffix of the read: four keys, six for a synchronous
/// input).
struct ZinMOX_ReportedSignal {
  static constexpr uint32_t kMaxKeys = 6;
  const ZinMOX_SignalGroup* group;
  uint32_t keyCount;
  std::size_t keyHashes[kMaxKeys];
};

/// One entry of a value-map write once checked: its group and whether it is a pulse train.
struct ZinMOX_StagedValue {
  ZinMOX_SignalGroup* group;
  bool pulseTrain;
};

struct ZinMOX_Core::Parts {
  ZinMOX_Command command;
  ZinMOX_SignalTable inputSignals;   // owns its groups
  ZinMOX_SignalTable outputSignals;  // owns its groups
  // What the value-map read reports, kept so that a read of an unchanged core allocates and hashes
  // nothing; rebuilt before the next read whenever the input table changes. The packed vectors
  // of a signal go to one buffer, and a key that the map does not hold yet is built in one string.
  std::vector<ZinMOX_ReportedSignal> readPlan;
  bool readPlanStale = true;
  std::string readKey;
  std::vector<uint8_t> readVectors;
  // Scratch of the value-map write: each entry's group and pulse-train mark from the checking
  // visit; the digits of a value whose converted part takes fill digits, and the converted
  // bytes of the value being staged.
  std::vector<ZinMOX_StagedValue> writePlan;
  Zin_ByteBuffer writeText;
  Zin_ByteBuffer writeBytes;
};

/// The port image of a core, for the library's own checks (tests, fuzzers).
struct ZinMOX_CoreAccess {
  static const ZinMOX_Command& command(const ZinMOX_Core& core) { return core.parts->command; }
};

}  // namespace ZinRT

#endif
