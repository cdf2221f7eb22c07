// The transport seam: the one interface through which every JTAG transfer of a session passes.
#ifndef ZINRT_ZIN_TRANSPORT_H
#define ZINRT_ZIN_TRANSPORT_H

#include <cstdint>
#include <string>
#include <vector>

#include "ZinRT/ZinCore_Types.h"

namespace ZinRT {

/// What stands behind a JTAG session: a scripted target in tests, the simulated target, a
/// remote target server, or a cable.
///
/// Contract:
/// - A session owns its transport from `ZinJtag_openSession` to `ZinJtag_closeSession`. The
///   framework calls it from one thread at a time per session (it serialises the calls), so an
///   implementation needs no lock of its own unless it is shared between sessions.
/// - Each operation either completes or throws. Any exception may be thrown; std::exception
///   subclasses with a clear `what()` are expected, since their text reaches the host as a
///   session message. An operation that throws must leave the target as it was before the
///   operation wherever the target allows it.
/// - Order: status reads and command sequences come in any order; `flush` follows each output
///   write sequence (`commandSequenceThenFlush` carries both).
class Zin_Transport {
 public:
  virtual ~Zin_Transport() = default;

  /// Reads the status of the core at `ref`. `info` and the `statusBytes` bytes at `status` arrive
  /// zero-filled; the implementation fills `info` and up to `statusBitCount` bits of the status
  /// word (bit i in bit i mod 8 of byte i/8). A reference where no core answers leaves both zero.
  virtual void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                          uint32_t statusBytes, uint32_t statusBitCount) = 0;

  /// Carries out a command sequence: lines of seven blank-separated fields joined by "\n"
  /// (device, chain, core, code, read flag, bit length, data; hexadecimal). When `readBitCount`
  /// is not 0, `readData` holds ceil(readBitCount/8) zero bytes and receives the data shifted
  /// out by the lines whose read flag is 1, in line order, each line's data occupying whole
  /// bytes as a little-endian number.
  virtual void commandSequence(const std::string& text, unsigned char* readData,
                               uint32_t readBitCount) = 0;

  /// Makes every earlier command take effect on the target.
  virtual void flush() = 0;

  /// An output write: `commandSequence`, then `flush` once the sequence has completed. A
  /// transport that can carry both in one exchange (a remote target) overrides it; whatever it
  /// throws must be what the two calls would have thrown.
  virtual void commandSequenceThenFlush(const std::string& text, unsigned char* readData,
                                        uint32_t readBitCount) {
    commandSequence(text, readData, readBitCount);
    flush();
  }

  /// Optional: appends to `refs` the references where a core answers a status read and returns
  /// true; a transport that cannot enumerate returns false (the default).
  virtual bool listCores(std::vector<ZIN_CORE_REF>& refs) {
    (void)refs;
    return false;
  }
};

}  // namespace ZinRT

#endif
