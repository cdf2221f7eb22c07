// The transport seam over TCP: each operation is one request frame and its reply.
#include "ZinNet/TcpTransport.h"

#include <algorithm>
#include <cstring>

#include "ClientChannel.h"

namespace ZinNet {

using Protocol::MessageType;

struct TcpTransport::Impl {
  Impl(Endpoint endpoint, ClientOptions options) : channel(std::move(endpoint), options) {}
  ClientChannel channel;
};

namespace {

[[noreturn]] void badReply(const ClientChannel& channel, const char* what, const FrameError& e) {
  throw NetError("ZinNet: malformed answer from " + channel.serverText() + " to " + what + ": " +
                 e.what());
}

}  // namespace

TcpTransport::TcpTransport(std::string host, uint16_t port, ClientOptions options)
    : TcpTransport(Endpoint{std::move(host), port}, options) {}

TcpTransport::TcpTransport(const Endpoint& endpoint, ClientOptions options)
    : impl_(std::make_unique<Impl>(endpoint, options)) {
  if (endpoint.host.empty()) throw std::invalid_argument("ZinNet::TcpTransport: empty host");
  if (endpoint.port == 0) throw std::invalid_argument("ZinNet::TcpTransport: port 0");
}

TcpTransport::~TcpTransport() = default;

void TcpTransport::connect() {
  std::lock_guard<std::mutex> lock(mutex_);
  impl_->channel.ensureConnected();
}

void TcpTransport::disconnect() {
  std::lock_guard<std::mutex> lock(mutex_);
  impl_->channel.disconnect();
}

bool TcpTransport::isConnected() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return impl_->channel.isConnected();
}

std::string TcpTransport::serverName() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return impl_->channel.serverName();
}

std::string TcpTransport::serverText() const {
  return impl_->channel.serverText();
}

void TcpTransport::readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                              uint32_t statusBytes, uint32_t statusBitCount) {
  // The server answers at most kMaxStatusBytes bytes; any bytes beyond stay zero.
  const uint32_t bytes = std::min(statusBytes, Protocol::kMaxStatusBytes);
  const uint32_t bits = std::min(statusBitCount, 8 * bytes);
  FrameWriter request(MessageType::ReadStatus);
  request.u32(ref.deviceIndex).u32(ref.userChainNumber).u32(ref.coreIndex).u32(bytes).u32(bits);
  std::lock_guard<std::mutex> lock(mutex_);
  ClientChannel& channel = impl_->channel;
  const Frame reply = channel.exchange(request.finish(), MessageType::Status, "a status read");
  try {
    FrameReader in(reply, "status");
    ZIN_CORE_INFO got{};
    got.manufacturerId = in.u32();
    got.coreType = in.u32();
    got.coreMajorVersion = in.u32();
    got.coreMinorVersion = in.u32();
    got.coreRevision = in.u32();
    const unsigned char* data = in.bytes(bytes);
    in.end();
    info = got;
    if (bytes != 0) std::memcpy(status, data, bytes);
  } catch (const FrameError& e) {
    channel.disconnect();
    badReply(channel, "a status read", e);
  }
}

void TcpTransport::commandSequence(const std::string& text, unsigned char* readData,
                                   uint32_t readBitCount) {
  std::lock_guard<std::mutex> lock(mutex_);
  sendSequence(static_cast<uint8_t>(MessageType::CommandSequence), text, readData, readBitCount);
}

void TcpTransport::commandSequenceThenFlush(const std::string& text, unsigned char* readData,
                                            uint32_t readBitCount) {
  std::lock_guard<std::mutex> lock(mutex_);
  impl_->channel.ensureConnected();
  if (impl_->channel.version() >= 2) {
    sendSequence(static_cast<uint8_t>(MessageType::SequenceAndFlush), text, readData, readBitCount);
    return;
  }
  sendSequence(static_cast<uint8_t>(MessageType::CommandSequence), text, readData, readBitCount);
  flushLocked();
}

void TcpTransport::sendSequence(uint8_t type, const std::string& text, unsigned char* readData,
                                uint32_t readBitCount) {
  const uint32_t readBytes = readBitCount / 8 + (readBitCount % 8 != 0 ? 1 : 0);
  ClientChannel& channel = impl_->channel;
  channel.ensureConnected();
  if (text.size() + 5 > channel.serverMaxFrame()) {
    throw NetError("ZinNet: a command sequence of " + std::to_string(text.size()) +
                   " bytes is more than the server at " + channel.serverText() + " takes (" +
                   std::to_string(channel.serverMaxFrame()) + "-byte frames)");
  }
  if (readBytes > channel.serverMaxRead()) {
    throw NetError("ZinNet: a command sequence reading " + std::to_string(readBytes) +
                   " bytes is more than the server at " + channel.serverText() + " takes (" +
                   std::to_string(channel.serverMaxRead()) + " bytes)");
  }
  FrameWriter request(static_cast<MessageType>(type));
  request.u32(readBitCount).text(text);
  const Frame reply =
      channel.exchange(request.finish(), MessageType::ReadData, "a command sequence");
  if (reply.body.size() != readBytes) {
    channel.disconnect();
    throw NetError("ZinNet: " + channel.serverText() + " answered a command sequence with " +
                   std::to_string(reply.body.size()) + " bytes of read data instead of " +
                   std::to_string(readBytes));
  }
  if (readBytes != 0) std::memcpy(readData, reply.body.data(), readBytes);
}

void TcpTransport::ping() {
  std::lock_guard<std::mutex> lock(mutex_);
  ClientChannel& channel = impl_->channel;
  channel.ensureConnected();
  if (channel.version() < 2) {
    throw NetError("ZinNet: the server at " + channel.serverText() +
                   " speaks protocol version 1, which has no ping");
  }
  const Frame reply =
      channel.exchange(FrameWriter(MessageType::Ping).finish(), MessageType::Pong, "a ping");
  if (!reply.body.empty()) {
    channel.disconnect();
    throw NetError("ZinNet: " + channel.serverText() + " answered a ping with a non-empty body");
  }
}

uint16_t TcpTransport::protocolVersion() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return impl_->channel.version();
}

void TcpTransport::flush() {
  std::lock_guard<std::mutex> lock(mutex_);
  flushLocked();
}

void TcpTransport::flushLocked() {
  ClientChannel& channel = impl_->channel;
  const Frame reply =
      channel.exchange(FrameWriter(MessageType::Flush).finish(), MessageType::Flushed, "a flush");
  if (!reply.body.empty()) {
    channel.disconnect();
    throw NetError("ZinNet: " + channel.serverText() + " answered a flush with a non-empty body");
  }
}

bool TcpTransport::listCores(std::vector<ZIN_CORE_REF>& refs) {
  std::lock_guard<std::mutex> lock(mutex_);
  ClientChannel& channel = impl_->channel;
  const Frame reply = channel.exchange(FrameWriter(MessageType::ListCores).finish(),
                                       MessageType::Cores, "a core list");
  try {
    FrameReader in(reply, "cores");
    const bool supported = in.u8() != 0;
    const uint32_t count = in.u32();
    if (in.remaining() != 12ull * count) throw FrameError("the count does not match the body");
    std::vector<ZIN_CORE_REF> got(count);
    for (ZIN_CORE_REF& ref : got) {
      ref.deviceIndex = in.u32();
      ref.userChainNumber = in.u32();
      ref.coreIndex = in.u32();
    }
    if (!supported) return false;
    refs.insert(refs.end(), got.begin(), got.end());
    return true;
  } catch (const FrameError& e) {
    channel.disconnect();
    badReply(channel, "a core list", e);
  }
}

}  // namespace ZinNet
