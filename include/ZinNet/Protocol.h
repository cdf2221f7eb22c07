// Constants of the target server's wire protocol (docs/protocol.md describes the frames).
#ifndef ZINNET_PROTOCOL_H
#define ZINNET_PROTOCOL_H

#include <cstdint>

namespace ZinNet::Protocol {

/// The newest version this library speaks; the client asks for it in its greeting and falls
/// back to kOldestVersion when the server refuses it. The server speaks both.
inline constexpr uint16_t kVersion = 2;
inline constexpr uint16_t kOldestVersion = 1;
/// The four bytes that open every greeting and welcome body.
inline constexpr char kMagic[4] = {'Z', 'N', 'E', 'T'};
/// Bytes of the length prefix (unsigned, big-endian) before each frame.
inline constexpr uint32_t kLengthBytes = 4;
/// A status read may ask for at most this many status bytes.
inline constexpr uint32_t kMaxStatusBytes = 256;
/// Error texts longer than this are cut.
inline constexpr uint32_t kMaxErrorText = 4096;

/// The first byte of every frame.
enum class MessageType : uint8_t {
  // Client to server.
  Hello = 0x01,             // magic, u16 version
  ReadStatus = 0x02,        // u32 device, chain, core, status bytes, status bit count
  CommandSequence = 0x03,   // u32 read bit count, then the command text
  Flush = 0x04,             // empty
  ListCores = 0x05,         // empty
  SequenceAndFlush = 0x06,  // version 2: as CommandSequence, then a flush; answered by ReadData
  Ping = 0x07,              // version 2: empty; answered by Pong without touching the target
  // Server to client.
  Welcome = 0x81,       // magic, u16 version, u32 max frame bytes, u32 max read bytes, name text
  Status = 0x82,        // 5 x u32 core information, then the status bytes
  ReadData = 0x83,      // the read data bytes
  Flushed = 0x84,       // empty
  Cores = 0x85,         // u8 supported, u32 count, count x (u32 device, chain, core)
  Pong = 0x87,          // empty
  TargetFailed = 0xE0,  // text: the target refused or failed the request; connection stays
  Refused = 0xE1,       // text: the request was malformed; connection stays
  Closing = 0xE2        // text: the server closes the connection after this frame
};

}  // namespace ZinNet::Protocol

#endif
