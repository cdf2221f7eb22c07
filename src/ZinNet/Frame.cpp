// Frame building and bounds-checked reading.
#include "Frame.h"

#include <cstdio>

namespace ZinNet {

using Protocol::MessageType;

FrameWriter::FrameWriter(MessageType type) : bytes_(Protocol::kLengthBytes, 0) {
  bytes_.push_back(static_cast<unsigned char>(type));
}

FrameWriter& FrameWriter::u8(uint8_t value) {
  bytes_.push_back(value);
  return *this;
}

FrameWriter& FrameWriter::u16(uint16_t value) {
  bytes_.push_back(static_cast<unsigned char>(value >> 8));
  bytes_.push_back(static_cast<unsigned char>(value));
  return *this;
}

FrameWriter& FrameWriter::u32(uint32_t value) {
  for (int shift = 24; shift >= 0; shift -= 8) {
    bytes_.push_back(static_cast<unsigned char>(value >> shift));
  }
  return *this;
}

FrameWriter& FrameWriter::bytes(const void* data, size_t size) {
  const auto* first = static_cast<const unsigned char*>(data);
  bytes_.insert(bytes_.end(), first, first + size);
  return *this;
}

FrameWriter& FrameWriter::text(std::string_view text) {
  return bytes(text.data(), text.size());
}

std::vector<unsigned char> FrameWriter::finish() const {
  std::vector<unsigned char> out = bytes_;
  const size_t length = out.size() - Protocol::kLengthBytes;
  if (length > UINT32_MAX) throw FrameError("frame of " + std::to_string(length) + " bytes");
  for (uint32_t i = 0; i < 4; ++i) {
    out[i] = static_cast<unsigned char>(length >> (24 - 8 * i));
  }
  return out;
}

FrameReader::FrameReader(const Frame& frame, const char* what)
    : data_(frame.body.data()), size_(frame.body.size()), what_(what) {}

const unsigned char* FrameReader::need(size_t size) {
  if (size > size_ - pos_) {
    throw FrameError(std::string(what_) + " body too short: " + std::to_string(size_) + " bytes");
  }
  const unsigned char* at = data_ + pos_;
  pos_ += size;
  return at;
}

uint8_t FrameReader::u8() {
  return *need(1);
}

uint16_t FrameReader::u16() {
  const unsigned char* p = need(2);
  return static_cast<uint16_t>((p[0] << 8) | p[1]);
}

uint32_t FrameReader::u32() {
  const unsigned char* p = need(4);
  return decodeLength(p);
}

const unsigned char* FrameReader::bytes(size_t size) {
  return need(size);
}

std::string FrameReader::rest() {
  const size_t n = remaining();
  const unsigned char* p = need(n);
  return std::string(reinterpret_cast<const char*>(p), n);
}

void FrameReader::end() const {
  if (pos_ != size_) {
    throw FrameError(std::string(what_) + " body too long: " + std::to_string(size_) + " bytes");
  }
}

uint32_t decodeLength(const unsigned char* prefix) {
  return (uint32_t{prefix[0]} << 24) | (uint32_t{prefix[1]} << 16) | (uint32_t{prefix[2]} << 8) |
         uint32_t{prefix[3]};
}

std::string typeText(uint8_t type) {
  const char* name = "unknown";
  switch (static_cast<MessageType>(type)) {
    case MessageType::Hello:
      name = "hello";
      break;
    case MessageType::ReadStatus:
      name = "status read";
      break;
    case MessageType::CommandSequence:
      name = "command sequence";
      break;
    case MessageType::Flush:
      name = "flush";
      break;
    case MessageType::ListCores:
      name = "core list";
      break;
    case MessageType::SequenceAndFlush:
      name = "command sequence and flush";
      break;
    case MessageType::Ping:
      name = "ping";
      break;
    case MessageType::Pong:
      name = "pong";
      break;
    case MessageType::Welcome:
      name = "welcome";
      break;
    case MessageType::Status:
      name = "status";
      break;
    case MessageType::ReadData:
      name = "read data";
      break;
    case MessageType::Flushed:
      name = "flushed";
      break;
    case MessageType::Cores:
      name = "cores";
      break;
    case MessageType::TargetFailed:
      name = "target failure";
      break;
    case MessageType::Refused:
      name = "refusal";
      break;
    case MessageType::Closing:
      name = "closing";
      break;
  }
  char text[48];
  std::snprintf(text, sizeof text, "0x%02X (%s)", type, name);
  return text;
}

std::string boundedText(std::string_view text) {
  if (text.size() <= Protocol::kMaxErrorText) return std::string(text);
  return std::string(text.substr(0, Protocol::kMaxErrorText - 3)) + "...";
}

}  // namespace ZinNet
