// The hub protocol's scans, without any I/O.
#include "ZinHub/HubCodec.h"

#include <stdexcept>

#include "ZinHub/Crc16.h"

namespace ZinHub {

namespace {

constexpr unsigned kBusyBit = 12;
constexpr unsigned kStagedInvalidBit = 13;
constexpr unsigned kCoreCountShift = 8;

// True when the data bits at [first, first+count) and the 16 CRC bits after them check out.
bool crcHolds(const BitVector& tdo, size_t first, size_t count) {
  if (first + count + kCrcBits > tdo.size()) return false;
  return crc16(tdo, first, count + kCrcBits) == 0;
}

uint32_t recordField(const BitVector& tdo, size_t first, unsigned count) {
  return static_cast<uint32_t>(readNumber(tdo, kHeaderBits + first, count));
}

}  // namespace

void appendHeader(BitVector& tdi, HubOp op, unsigned core) {
  appendNumber(tdi, static_cast<unsigned>(op), 4);
  appendNumber(tdi, core, 4);
  appendNumber(tdi, kRequestKey, 8);
}

CaptureWord parseCaptureWord(const BitVector& tdo) {
  const auto word = static_cast<unsigned>(readNumber(tdo, 0, kHeaderBits));
  CaptureWord capture;
  capture.hub = tdo.size() >= kHeaderBits && (word & 0xFFU) == kCapturePattern &&
                ((word >> 8) & 0xFU) == kProtocolVersion && (word >> 14) == 0;
  capture.busy = capture.hub && ((word >> kBusyBit) & 1U) != 0;
  capture.stagedInvalid = capture.hub && ((word >> kStagedInvalidBit) & 1U) != 0;
  return capture;
}

BitVector infoRequest() {
  BitVector tdi;
  appendHeader(tdi, HubOp::kInfo, 0);
  tdi.resize(kHeaderBits + kHubRecordBits + kCrcBits, 0);
  return tdi;
}

BitVector statusRequest(unsigned core) {
  BitVector tdi;
  appendHeader(tdi, HubOp::kStatus, core);
  tdi.resize(kHeaderBits + kStatusRecordBits + kCrcBits, 0);
  return tdi;
}

BitVector stageRequest(unsigned core, const BitVector& data) {
  BitVector tdi;
  tdi.reserve(kHeaderBits + data.size() + kCrcBits);
  appendHeader(tdi, HubOp::kStage, core);
  tdi.insert(tdi.end(), data.begin(), data.end());
  appendCrc(tdi, crc16(data, 0, data.size()));
  return tdi;
}

BitVector replyRequest(HubOp op, unsigned core, unsigned waitBits, size_t replyBits) {
  BitVector tdi;
  appendHeader(tdi, op, core);
  tdi.resize(kHeaderBits + size_t{waitBits} + 1 + replyBits, 0);
  return tdi;
}

std::optional<HubInfo> parseInfoReply(const BitVector& tdo) {
  if (!parseCaptureWord(tdo).hub) return std::nullopt;
  if (!crcHolds(tdo, kHeaderBits, kHubRecordBits)) {
    throw std::runtime_error(integrityText("hub record"));
  }
  const uint32_t record = recordField(tdo, 0, kHubRecordBits);
  HubInfo info;
  info.version = record & 0xFFU;
  info.coreCount = (record >> kCoreCountShift) & 0x1FU;
  return info;
}

StatusRecord parseStatusReply(const BitVector& tdo, const std::string& where) {
  StatusRecord record;
  if (!parseCaptureWord(tdo).hub) return record;
  if (!crcHolds(tdo, kHeaderBits, kStatusRecordBits))
    throw std::runtime_error(integrityText(where));
  record.info.manufacturerId = recordField(tdo, 0, 8);
  record.info.coreType = recordField(tdo, 8, 8);
  record.info.coreMajorVersion = recordField(tdo, 16, 8);
  record.info.coreMinorVersion = recordField(tdo, 24, 8);
  record.info.coreRevision = recordField(tdo, 32, 8);
  for (unsigned i = 0; i < kStatusRecordBits; ++i) {
    if (tdo[kHeaderBits + i] != 0)
      record.status[i / 8] |= static_cast<unsigned char>(1U << (i % 8));
  }
  return record;
}

std::optional<size_t> findReply(const BitVector& tdo, unsigned waitBits) {
  for (size_t at = kHeaderBits; at <= size_t{kHeaderBits} + waitBits && at < tdo.size(); ++at) {
    if (tdo[at] != 0) return at + 1;
  }
  return std::nullopt;
}

unsigned parseResultReply(const BitVector& tdo, unsigned waitBits, const std::string& where) {
  const std::optional<size_t> reply = findReply(tdo, waitBits);
  if (!reply || *reply + kResultBits > tdo.size()) {
    throw std::runtime_error(noAnswerText(where, waitBits));
  }
  return static_cast<unsigned>(readNumber(tdo, *reply, kResultBits));
}

void parseCaptureReply(const BitVector& tdo, unsigned waitBits, size_t captureBits,
                       const std::string& where, unsigned char* out) {
  const std::optional<size_t> reply = findReply(tdo, waitBits);
  if (!reply) throw std::runtime_error(noAnswerText(where, waitBits));
  if (!crcHolds(tdo, *reply, captureBits)) throw std::runtime_error(integrityText(where));
  for (size_t k = 0; k < captureBits; ++k) {
    if (tdo[*reply + k] != 0) out[k / 8] |= static_cast<unsigned char>(1U << (k % 8));
  }
}

std::string noAnswerText(const std::string& where, unsigned waitBits) {
  return where + " did not answer within " + std::to_string(waitBits) + " TCK cycles";
}

std::string integrityText(const std::string& where) {
  return where + ": reply failed its CRC check (integrity failure on the scan chain)";
}

}  // namespace ZinHub
