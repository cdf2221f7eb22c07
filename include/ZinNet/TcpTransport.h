// The transport of a session whose target sits behind a target server, reached over TCP.
#ifndef ZINNET_TCPTRANSPORT_H
#define ZINNET_TCPTRANSPORT_H

#include <cstdint>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinNet/Endpoint.h"
#include "ZinNet/ZinNet_Export.h"
#include "ZinRT/Zin_Transport.h"

namespace ZinNet {

/// A failure of the connection itself: no connection, a timeout, a lost connection, a server that
/// speaks another protocol or refuses a request. The text names the server and what happened.
class ZINNET_API NetError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// The target behind the server refused or failed a request. The text is the target's own, as a
/// local target would have reported it.
class ZINNET_API TargetError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct ClientOptions {
  uint32_t connectTimeoutMs = 3000;   // resolution, connect and greeting together
  uint32_t requestTimeoutMs = 10000;  // sending a request and receiving its whole answer
};

/// Reaches the target of a server started with `zinmox serve` or ZinNet::Server.
///
///   auto transport = std::make_shared<ZinNet::TcpTransport>("127.0.0.1", 5555);
///   transport->connect();                        // optional: report a missing server now
///   uint32_t handle = ZinJtag_openSession(transport);
///
/// Connects on first use. Any failure of the connection (timeout, reset, end of stream, a
/// malformed answer) closes it and throws NetError; the call in progress fails, and the next call
/// connects again. A request that failed that way may or may not have reached the target. The
/// calls are serialised by a mutex of the transport, so it may be shared between sessions.
class ZINNET_API TcpTransport : public ZinRT::Zin_Transport {
 public:
  TcpTransport(std::string host, uint16_t port, ClientOptions options = {});
  explicit TcpTransport(const Endpoint& endpoint, ClientOptions options = {});
  ~TcpTransport() override;
  TcpTransport(const TcpTransport&) = delete;
  TcpTransport& operator=(const TcpTransport&) = delete;

  /// Connects and greets the server unless connected. Throws NetError.
  void connect();
  /// Closes the connection (the next call connects again).
  void disconnect();
  bool isConnected() const;
  /// The name the server announced in its welcome ("" before the first connection).
  std::string serverName() const;
  /// "HOST:PORT" of the server.
  std::string serverText() const;
  /// The protocol version agreed with the server (0 before the first connection).
  uint16_t protocolVersion() const;
  /// One round trip to the server that does not touch the target (version 2 servers; a
  /// version 1 server throws NetError). Connects first unless connected.
  void ping();

  void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                  uint32_t statusBytes, uint32_t statusBitCount) override;
  void commandSequence(const std::string& text, unsigned char* readData,
                       uint32_t readBitCount) override;
  void flush() override;
  /// One request to a version 2 server; a command sequence and a flush to a version 1 server.
  void commandSequenceThenFlush(const std::string& text, unsigned char* readData,
                                uint32_t readBitCount) override;
  bool listCores(std::vector<ZIN_CORE_REF>& refs) override;

 private:
  struct Impl;
  void sendSequence(uint8_t type, const std::string& text, unsigned char* readData,
                    uint32_t readBitCount);
  void flushLocked();
  mutable std::mutex mutex_;
  std::unique_ptr<Impl> impl_;
};

}  // namespace ZinNet

#endif
