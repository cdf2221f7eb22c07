// A JtagEngine that sends its scans to a running OpenOCD through its Tcl server, so every cable
// OpenOCD drives carries the hub protocol.
#ifndef ZINHUB_OPENOCDENGINE_H
#define ZINHUB_OPENOCDENGINE_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "ZinHub/Board.h"
#include "ZinHub/JtagEngine.h"
#include "ZinHub/TclConnection.h"

namespace ZinHub {

/// The queued scans become `irscan`/`drscan` commands of one Tcl script, run by OpenOCD as one
/// request; the results come back as hex. A script is at most kMaxTclRequest bytes, so a batch
/// larger than that takes several requests. Wide scans go as fields of kFieldBits bits.
///
/// Every new connection is checked against the board: each device's TAP must exist in OpenOCD
/// with the board's IR length and, where the board names one, the expected IDCODE. Each request
/// loads the IR of a device before its first DR scan in that request, so a restarted OpenOCD or
/// another Tcl client between two requests cannot leave a wrong instruction in place.
class OpenOcdEngine : public JtagEngine {
 public:
  static constexpr size_t kMaxTclRequest = size_t{1} << 20;
  static constexpr unsigned kFieldBits = 1024;

  OpenOcdEngine(std::string host, uint16_t port, Board board, OpenOcdOptions options = {});

  /// Connects (unless connected) and checks the board. Throws std::runtime_error.
  void connect();

  void queueIrScan(uint32_t device, uint32_t irLength, uint64_t instruction) override;
  void queueDrScan(uint32_t device, BitVector tdi) override;
  std::vector<BitVector> execute() override;

  /// One raw Tcl request on the engine's connection (its result text; Tcl errors come back as
  /// text too). For benchmarks and diagnostics.
  std::string tcl(const std::string& script);

  std::string where() const { return connection_.where(); }

  /// The Tcl script of the last request the engine sent (for benchmarks that replay it).
  const std::string& lastScript() const { return lastScript_; }

 private:
  struct Scan {
    uint32_t device = 0;
    bool ir = false;
    uint64_t instruction = 0;
    BitVector tdi;
  };
  void checkBoard(const std::string& scanChain) const;
  void runRequest(const std::vector<const Scan*>& scans, std::vector<BitVector>& results);
  std::string irCommand(uint32_t device, uint64_t instruction) const;
  std::string drCommand(const Scan& scan) const;

  TclConnection connection_;
  Board board_;
  std::vector<Scan> queue_;
  std::vector<std::optional<uint64_t>> instruction_;  // last instruction queued per device
  std::string lastScript_;
};

}  // namespace ZinHub

#endif
