// Helpers of the server tests: a server on an ephemeral loopback port with a captured log, and a
// raw client that sends arbitrary bytes and reads frames with deadlines.
#ifndef ZIN_TESTS_NET_NETTESTUTIL_H
#define ZIN_TESTS_NET_NETTESTUTIL_H

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
#include "ZinSim/Target.h"

namespace ZinNetTest {

using Bytes = std::vector<unsigned char>;

// Message types (docs/protocol.md).
constexpr uint8_t kReadStatus = 0x02;
constexpr uint8_t kSequence = 0x03;
constexpr uint8_t kSequenceAndFlush = 0x06;
constexpr uint8_t kPing = 0x07;
constexpr uint8_t kReadData = 0x83;
constexpr uint8_t kPong = 0x87;
constexpr uint8_t kRefused = 0xE1;
constexpr uint8_t kClosing = 0xE2;

/// Frame bytes built by hand: big-endian length of (type + body), type, body.
Bytes frame(uint8_t type, const Bytes& body = {});
Bytes u32(uint32_t value);
Bytes concat(std::initializer_list<Bytes> parts);
Bytes text(const std::string& s);
/// A hello of the given version.
Bytes hello(uint16_t version = 2);

/// A server test mode: serves `transport` on 127.0.0.1 and a free port; the log is kept.
class TestServer {
 public:
  explicit TestServer(std::shared_ptr<ZinRT::Zin_Transport> transport,
                      ZinNet::ServerOptions options = {});
  ~TestServer();
  ZinNet::Server& server() { return *server_; }
  uint16_t port() const { return server_->port(); }
  std::vector<std::string> log() const;
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

/// One received frame.
struct RawFrame {
  uint8_t type = 0;
  Bytes body;
  std::string text() const { return std::string(body.begin(), body.end()); }
};

/// A client that speaks raw bytes. Every read is bounded by a deadline.
class RawClient {
 public:
  explicit RawClient(uint16_t port);
  void send(const Bytes& bytes);
  /// Stops sending (the server sees the end of the stream).
  void shutdownSend();
  void close();
  /// The next frame, or nothing when the connection ended or `limit` passed.
  std::optional<RawFrame> readFrame(std::chrono::milliseconds limit = std::chrono::seconds(3));
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
