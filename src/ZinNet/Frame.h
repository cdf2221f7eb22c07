// Frames of the wire protocol: building bodies, reading them with bounds checks, the prefix.
#ifndef ZINNET_SRC_FRAME_H
#define ZINNET_SRC_FRAME_H

#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "ZinNet/Protocol.h"

namespace ZinNet {

/// A body that does not have the layout its type asks for.
class FrameError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// One frame: its type byte and the bytes after it.
struct Frame {
  Protocol::MessageType type{};
  std::vector<unsigned char> body;
};

/// Builds a frame, big-endian integers.
class FrameWriter {
 public:
  explicit FrameWriter(Protocol::MessageType type);
  FrameWriter& u8(uint8_t value);
  FrameWriter& u16(uint16_t value);
  FrameWriter& u32(uint32_t value);
  FrameWriter& bytes(const void* data, size_t size);
  FrameWriter& text(std::string_view text);
  /// The length prefix followed by the type byte and the body.
  std::vector<unsigned char> finish() const;

 private:
  std::vector<unsigned char> bytes_;  // starts with room for the prefix
};

/// Reads a body front to back; running past its end throws FrameError.
class FrameReader {
 public:
  FrameReader(const Frame& frame, const char* what);
  uint8_t u8();
  uint16_t u16();
  uint32_t u32();
  const unsigned char* bytes(size_t size);
  /// The remaining bytes as text.
  std::string rest();
  size_t remaining() const { return size_ - pos_; }
  /// Throws FrameError when bytes are left over.
  void end() const;

 private:
  const unsigned char* need(size_t size);
  const unsigned char* data_;
  size_t size_;
  size_t pos_ = 0;
  const char* what_;
};

/// The frame made of the bytes after a length prefix (at least one): the type byte, then the body.
/// Throws FrameError when there is no type byte.
Frame frameOf(std::vector<unsigned char> bytes);

/// The frame length from the four prefix bytes.
uint32_t decodeLength(const unsigned char* prefix);

/// "0x03 (command sequence)": how messages name a type byte.
std::string typeText(uint8_t type);

/// Cuts an error text to the protocol's limit.
std::string boundedText(std::string_view text);

}  // namespace ZinNet

#endif
