// The transport seam over a hub: status reads, command lines and core lists become JTAG scans.
#ifndef ZINHUB_HUBTRANSPORT_H
#define ZINHUB_HUBTRANSPORT_H

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "ZinHub/Board.h"
#include "ZinHub/CommandLines.h"
#include "ZinHub/JtagEngine.h"
#include "ZinRT/Zin_Transport.h"

namespace ZinHub {

/// Maps the transport seam onto a JtagEngine. A status read is one core-status scan; a command
/// sequence is checked whole, then sent as one batch: one DR scan per line, with an IR scan only
/// where the device or user chain changes. Replies are checked (capture word, start bit, CRC)
/// after the batch ran; the first failure throws "ZinHub: command line N: ...". Like every
/// transport, it is called from one thread at a time.
class HubTransport : public ZinRT::Zin_Transport {
 public:
  explicit HubTransport(std::shared_ptr<JtagEngine> engine, Board board = rtlModelBoard());

  void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                  uint32_t statusBytes, uint32_t statusBitCount) override;
  void commandSequence(const std::string& text, unsigned char* readData,
                       uint32_t readBitCount) override;
  void flush() override;
  /// Hub discovery: a hub-info scan per device and user chain, then a status scan per core.
  bool listCores(std::vector<ZIN_CORE_REF>& refs) override;

  const Board& board() const { return board_; }

 private:
  bool knows(const ZIN_CORE_REF& ref) const;
  void select(uint32_t device, uint32_t chain);
  std::vector<BitVector> run();
  void checkLine(const HubLine& line, const BitVector& tdo, unsigned char* readData) const;
  void listChain(uint32_t device, uint32_t chain, std::vector<ZIN_CORE_REF>& refs);

  std::shared_ptr<JtagEngine> engine_;
  Board board_;
  std::vector<std::optional<uint64_t>> loaded_;  // instruction in each device's IR, if known
};

/// "core at D:C:K"
std::string coreText(const ZIN_CORE_REF& ref);

}  // namespace ZinHub

#endif
