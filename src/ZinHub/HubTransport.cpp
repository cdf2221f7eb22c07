// The transport seam over a hub.
#include "ZinHub/HubTransport.h"

#include <algorithm>
#include <stdexcept>

namespace ZinHub {

namespace {

constexpr unsigned kDoneBit = 1;
constexpr unsigned kRefusedBit = 2;
constexpr unsigned kMoxCoreType = 9;
constexpr unsigned kInfoBits = 40;  // manufacturer, type, major, minor, revision

std::string lineError(size_t index, const std::string& what) {
  return "ZinHub: command line " + std::to_string(index + 1) + ": " + what;
}

}  // namespace

std::string coreText(const ZIN_CORE_REF& ref) {
  return "core at " + std::to_string(ref.deviceIndex) + ":" + std::to_string(ref.userChainNumber) +
         ":" + std::to_string(ref.coreIndex);
}

HubTransport::HubTransport(std::shared_ptr<JtagEngine> engine, Board board)
    : engine_(std::move(engine)), board_(std::move(board)), loaded_(board_.devices.size()) {
  if (!engine_) throw std::invalid_argument("HubTransport needs a JTAG engine");
}

bool HubTransport::knows(const ZIN_CORE_REF& ref) const {
  return ref.deviceIndex < board_.devices.size() && ref.coreIndex < kMaxCores &&
         board_.devices[ref.deviceIndex].chainInstructions.count(ref.userChainNumber) != 0;
}

void HubTransport::select(uint32_t device, uint32_t chain) {
  const BoardDevice& tap = board_.devices[device];
  const uint64_t instruction = tap.chainInstructions.at(chain);
  if (loaded_[device] == instruction) return;
  engine_->queueIrScan(device, tap.irLength, instruction);
  loaded_[device] = instruction;
}

std::vector<BitVector> HubTransport::run() {
  try {
    return engine_->execute();
  } catch (...) {
    // The IR contents are unknown after a failed batch: load them again next time.
    std::fill(loaded_.begin(), loaded_.end(), std::nullopt);
    throw;
  }
}

void HubTransport::readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                              uint32_t statusBytes, uint32_t statusBitCount) {
  if (!knows(ref)) return;
  select(ref.deviceIndex, ref.userChainNumber);
  engine_->queueDrScan(ref.deviceIndex, statusRequest(ref.coreIndex));
  const std::vector<BitVector> tdo = run();
  const StatusRecord record = parseStatusReply(tdo.at(0), coreText(ref));
  if (record.info.coreType == 0) return;
  info = record.info;
  // A MOX core's decoder reads the record as it is (its status from bit 40 on); a core of
  // another type carries its own status word from record bit 40, handed up from bit 0.
  const unsigned shift = record.info.coreType == kMoxCoreType ? 0 : kInfoBits;
  const uint64_t bits = std::min<uint64_t>(
      {statusBitCount, kStatusRecordBits - shift, uint64_t{statusBytes} * 8});
  for (uint64_t i = 0; i < bits; ++i) {
    const uint64_t from = i + shift;
    if (((record.status[from / 8] >> (from % 8)) & 1U) != 0) {
      status[i / 8] |= static_cast<unsigned char>(1U << (i % 8));
    }
  }
}

void HubTransport::commandSequence(const std::string& text, unsigned char* readData,
                                   uint32_t readBitCount) {
  const std::vector<HubLine> lines =
      parseHubLines(text, board_, readData == nullptr ? 0 : (size_t{readBitCount} + 7) / 8);
  for (const HubLine& line : lines) {
    select(line.ref.deviceIndex, line.ref.userChainNumber);
    const unsigned waitBits = board_.devices[line.ref.deviceIndex].waitBits;
    const unsigned core = line.ref.coreIndex;
    switch (line.code) {
      case 1:
        engine_->queueDrScan(line.ref.deviceIndex, stageRequest(core, line.data));
        break;
      case 2:
        engine_->queueDrScan(line.ref.deviceIndex,
                             replyRequest(HubOp::kCommit, core, waitBits, kResultBits));
        break;
      case 3:
        engine_->queueDrScan(line.ref.deviceIndex,
                             replyRequest(HubOp::kCapture, core, waitBits, line.bitLength));
        break;
      default:
        engine_->queueDrScan(line.ref.deviceIndex,
                             replyRequest(HubOp::kClear, core, waitBits, kResultBits));
        break;
    }
  }
  const std::vector<BitVector> tdo = run();
  for (size_t i = 0; i < lines.size(); ++i) {
    try {
      checkLine(lines[i], tdo.at(i), readData);
      // A stage scan's own check shows in the capture word of the next scan on its chain.
      if (lines[i].code == 1 && i + 1 < lines.size() &&
          lines[i + 1].ref.deviceIndex == lines[i].ref.deviceIndex &&
          lines[i + 1].ref.userChainNumber == lines[i].ref.userChainNumber &&
          parseCaptureWord(tdo.at(i + 1)).stagedInvalid) {
        throw std::runtime_error(coreText(lines[i].ref) +
                                 " rejected the staged image (wrong length or CRC)");
      }
    } catch (const std::runtime_error& e) {
      throw std::runtime_error(lineError(i, e.what()));
    }
  }
}

void HubTransport::checkLine(const HubLine& line, const BitVector& tdo,
                             unsigned char* readData) const {
  const std::string where = coreText(line.ref);
  const CaptureWord capture = parseCaptureWord(tdo);
  if (!capture.hub) {
    throw std::runtime_error("no " + where + ": no hub answers on device " +
                             std::to_string(line.ref.deviceIndex) + ", user chain " +
                             std::to_string(line.ref.userChainNumber));
  }
  const unsigned waitBits = board_.devices[line.ref.deviceIndex].waitBits;
  if (capture.busy) {
    // The hub carried out nothing of this scan.
    throw std::runtime_error(where + " is busy: a request of an earlier scan has not completed");
  }
  if (line.code == 1) {
    return;  // its own check shows in the next scan's capture word
  } else if (line.code == 3) {
    parseCaptureReply(tdo, waitBits, line.bitLength - 16, where, readData + line.readOffset);
  } else {
    const unsigned result = parseResultReply(tdo, waitBits, where);
    if (line.code == 2 && (result & kRefusedBit) != 0) {
      throw std::runtime_error(where + " refused the commit: its staged image is invalid");
    }
    if ((result & kDoneBit) == 0) {
      throw std::runtime_error(where + " did not complete the " +
                               (line.code == 2 ? "commit" : "clear"));
    }
  }
}

void HubTransport::flush() {
  // Every call runs its own batch to the end, so nothing is left to send.
}

bool HubTransport::listCores(std::vector<ZIN_CORE_REF>& refs) {
  for (uint32_t device = 0; device < board_.devices.size(); ++device) {
    for (const auto& [chain, instruction] : board_.devices[device].chainInstructions) {
      (void)instruction;
      listChain(device, chain, refs);
    }
  }
  return true;
}

void HubTransport::listChain(uint32_t device, uint32_t chain, std::vector<ZIN_CORE_REF>& refs) {
  select(device, chain);
  engine_->queueDrScan(device, infoRequest());
  const std::optional<HubInfo> hub = parseInfoReply(run().at(0));
  if (!hub || hub->coreCount == 0) return;
  const unsigned count = std::min(hub->coreCount, kMaxCores);
  for (unsigned core = 0; core < count; ++core) engine_->queueDrScan(device, statusRequest(core));
  const std::vector<BitVector> tdo = run();
  for (unsigned core = 0; core < count; ++core) {
    const ZIN_CORE_REF ref{device, chain, core};
    if (parseStatusReply(tdo.at(core), coreText(ref)).info.coreType != 0) refs.push_back(ref);
  }
}

}  // namespace ZinHub
