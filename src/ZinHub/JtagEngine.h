// The seam between the hub transport and whatever moves bits on a scan chain: a pin-level model
// in process, a bit-bang adapter, or a debugger's scan queue.
#ifndef ZINHUB_JTAGENGINE_H
#define ZINHUB_JTAGENGINE_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZinHub/Bits.h"

namespace ZinHub {

/// Scans are queued and carried out together by `execute`, so an engine that batches (a
/// debugger's queue, a USB adapter) sends a whole command sequence at once. Between scans the
/// TAPs rest in Run-Test/Idle. Devices are numbered along the chain as in the board description;
/// an engine puts the devices it does not address into BYPASS.
class JtagEngine {
 public:
  virtual ~JtagEngine() = default;

  /// Queues an IR scan loading the `irLength` low bits of `instruction` (least significant bit
  /// first) into the IR of `device`.
  virtual void queueIrScan(uint32_t device, uint32_t irLength, uint64_t instruction) = 0;

  /// Queues a DR scan of `tdi` (bit 0 shifted first) through `device`.
  virtual void queueDrScan(uint32_t device, BitVector tdi) = 0;

  /// Carries out every queued scan in order and empties the queue. Returns the TDO bits of each
  /// DR scan, in queue order, each as long as its TDI. Throws when the engine fails (the queue is
  /// emptied then too).
  virtual std::vector<BitVector> execute() = 0;
};

}  // namespace ZinHub

#endif
