// The hub protocol's scans, without any I/O: what a request shifts in at TDI and what its reply
// means at TDO. Every scan starts with a 16-bit request header while the hub returns its 16-bit
// capture word; the op decides what follows.
#ifndef ZINHUB_HUBCODEC_H
#define ZINHUB_HUBCODEC_H

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "ZinHub/Bits.h"
#include "ZinRT/ZinCore_Types.h"

namespace ZinHub {

enum class HubOp : unsigned {
  kInfo = 0,
  kStage = 1,
  kCommit = 2,
  kCapture = 3,
  kClear = 4,
  kStatus = 5
};

constexpr unsigned kHeaderBits = 16;
constexpr unsigned kRequestKey = 0xA5;
constexpr unsigned kCapturePattern = 0x5A;
constexpr unsigned kProtocolVersion = 1;
constexpr unsigned kCrcBits = 16;
constexpr unsigned kHubRecordBits = 32;
constexpr unsigned kStatusRecordBits = 128;
constexpr unsigned kResultBits = 8;
constexpr unsigned kMaxCores = 16;
constexpr unsigned kDefaultWaitBits = 64;

/// The capture word a hub returns during the header.
struct CaptureWord {
  bool hub = false;            // the fixed pattern and protocol version 1 are there
  bool busy = false;           // a request of an earlier scan has not completed yet
  bool stagedInvalid = false;  // the last stage scan failed its check or was cut short
};

/// The 16 header bits: op, core index, request key.
void appendHeader(BitVector& tdi, HubOp op, unsigned core);

/// Reads the capture word from the first 16 bits at TDO.
CaptureWord parseCaptureWord(const BitVector& tdo);

/// TDI of a hub-info scan (64 bits) and of a core-status scan (160 bits).
BitVector infoRequest();
BitVector statusRequest(unsigned core);

/// TDI of a stage scan: header, the L data bits (number bit k first for k = 0..L-1), their CRC.
BitVector stageRequest(unsigned core, const BitVector& data);

/// TDI of a commit, capture or clear scan: header, W wait bits and room for the start bit and
/// `replyBits` reply bits (8 for commit and clear, N + 16 for a capture of N bits).
BitVector replyRequest(HubOp op, unsigned core, unsigned waitBits, size_t replyBits);

/// What a hub-info scan returned: nothing when no hub answers (the capture pattern is missing).
/// Throws std::runtime_error when the record fails its CRC.
struct HubInfo {
  unsigned version = 0;
  unsigned coreCount = 0;
};
std::optional<HubInfo> parseInfoReply(const BitVector& tdo);

/// What a core-status scan returned. `info` and `status` stay zero for a core index that the hub
/// does not serve and when no hub answers. Throws std::runtime_error when the record fails its
/// CRC; `where` names the core in that message ("core at 0:1:0").
struct StatusRecord {
  ZIN_CORE_INFO info{};
  unsigned char status[kStatusRecordBits / 8]{};  // record bit i in bit i % 8 of byte i / 8
};
StatusRecord parseStatusReply(const BitVector& tdo, const std::string& where);

/// Index of the first reply bit after the start bit, which must come within the first W + 1
/// bits after the header; nothing when it does not.
std::optional<size_t> findReply(const BitVector& tdo, unsigned waitBits);

/// The 8-bit result of a commit or clear scan. Throws when no start bit came within W cycles.
unsigned parseResultReply(const BitVector& tdo, unsigned waitBits, const std::string& where);

/// Checks a capture reply of `captureBits` bits and writes the read line's bytes: the number
/// whose bit k is capture bit k, little-endian, in ceil((captureBits + 16) / 8) bytes with the
/// 16 bits above the capture bits zero. Throws when no start bit came or the CRC fails.
void parseCaptureReply(const BitVector& tdo, unsigned waitBits, size_t captureBits,
                       const std::string& where, unsigned char* out);

/// The texts of the protocol's failures, each naming the core.
std::string noAnswerText(const std::string& where, unsigned waitBits);
std::string integrityText(const std::string& where);

}  // namespace ZinHub

#endif
