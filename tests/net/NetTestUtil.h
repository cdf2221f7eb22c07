// Helpers of the server tests: a server on an ephemeral loopback port with a captured log, and a
// raw client that sends arbitrary bytes and reads frames with deadlines.
#ifndef ZIN_TESTS_NET_NETTESTUTIL_H
#define ZIN_TESTS_NET_NETTESTUTIL_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <asio.hpp>
#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "ZinNet/Server.h"
#include "ZinNet/TcpTransport.h"
#include "ZinSim/Target.h"

namespace ZinNetTest {

using Bytes = std::vector<unsigned char>;
using testing::HasSubstr;

// Message types (docs/protocol.md).
constexpr uint8_t kReadStatus = 0x02, kSequence = 0x03, kFlush = 0x04, kSequenceAndFlush = 0x06;
constexpr uint8_t kPing = 0x07, kWelcome = 0x81, kReadData = 0x83, kPong = 0x87;
constexpr uint8_t kRefused = 0xE1, kClosing = 0xE2;

inline Bytes text(const std::string& s) {
  return Bytes(s.begin(), s.end());
}
inline Bytes u32(uint32_t v) {
  return {uint8_t(v >> 24), uint8_t(v >> 16), uint8_t(v >> 8), uint8_t(v)};
}
inline Bytes concat(std::initializer_list<Bytes> parts) {
  Bytes out;
  for (const Bytes& part : parts) out.insert(out.end(), part.begin(), part.end());
  return out;
}
/// Frame bytes built by hand: big-endian length of (type + body), type, body.
inline Bytes frame(uint8_t type, const Bytes& body = {}) {
  return concat({u32(static_cast<uint32_t>(body.size() + 1)), Bytes{type}, body});
}
inline Bytes hello(uint16_t version = 2) {
  return frame(0x01, concat({text("ZNET"), {uint8_t(version >> 8), uint8_t(version)}}));
}
/// The text of the `Error` that `call` throws, or "no failure".
template <class Error = ZinNet::NetError, class Call>
std::string errorOf(Call&& call) {
  try {
    call();
  } catch (const Error& e) {
    return e.what();
  }
  return "no failure";
}

/// Serves `transport` on 127.0.0.1 and a free port, keeping the log.
class TestServer {
 public:
  explicit TestServer(std::shared_ptr<ZinRT::Zin_Transport> transport,
                      ZinNet::ServerOptions options = {});
  ~TestServer() { server_->stop(); }
  ZinNet::Server& server() { return *server_; }
  uint16_t port() const { return server_->port(); }
  std::vector<std::string> log() const {
    std::lock_guard<std::mutex> lock(log_->mutex);
    return log_->lines;
  }
  /// Waits (bounded) until the server has no open connection.
  bool waitUntilNoConnections(std::chrono::milliseconds limit);

 private:
  struct Log {
    std::mutex mutex;
    std::vector<std::string> lines;
  };
  std::shared_ptr<Log> log_ = std::make_shared<Log>();
  std::unique_ptr<ZinNet::Server> server_;
};

struct RawFrame {
  uint8_t type = 0;
  Bytes body;
  std::string text() const { return std::string(body.begin(), body.end()); }
};

/// A client (or, accepted from an acceptor, a hand-made server) that speaks raw bytes. Every read
/// is bounded by a deadline.
class RawClient {
 public:
  /// Connects, and greets with `version` unless it is 0.
  explicit RawClient(uint16_t port, uint16_t version = 0);
  explicit RawClient(asio::ip::tcp::acceptor& acceptor);
  void send(const Bytes& bytes) {
    std::error_code ec;  // the server may already have closed: that is for the reads to show
    asio::write(socket_, asio::buffer(bytes), ec);
  }
  void shutdownSend() {
    std::error_code ec;
    socket_.shutdown(asio::ip::tcp::socket::shutdown_send, ec);
  }
  /// The next frame, or nothing when the connection ended or `limit` passed.
  std::optional<RawFrame> readFrame(std::chrono::milliseconds limit = std::chrono::seconds(3));
  /// Sends `request` and reads the reply, failing the test when none comes.
  RawFrame exchange(const Bytes& request,
                    std::chrono::milliseconds limit = std::chrono::seconds(3));
  /// Whether the server closed the connection within `limit` (frames before the end are
  /// dropped); false when it is still open at the limit.
  bool closedWithin(std::chrono::milliseconds limit);
  /// Sends a hello and checks that the welcome has the same version.
  void greet(uint16_t version = 2);

 private:
  bool readExactly(unsigned char* data, size_t size, std::chrono::steady_clock::time_point end);

  asio::io_context io_;
  asio::ip::tcp::socket socket_{io_};
  bool ended_ = false;
};

}  // namespace ZinNetTest

#endif
