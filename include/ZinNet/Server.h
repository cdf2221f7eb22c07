// The target server: serves one transport (normally a simulated target) to many TCP clients.
#ifndef ZINNET_SERVER_H
#define ZINNET_SERVER_H

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "ZinNet/ZinNet_Export.h"
#include "ZinRT/Zin_Transport.h"

namespace ZinNet {

struct ServerOptions {
  /// Address to listen on. Only loopback unless told otherwise. Any other address needs a token,
  /// or `insecure`.
  std::string host = "127.0.0.1";
  /// 0 takes a free port (see Server::port()).
  uint16_t port = 0;
  /// Largest frame a client may send, length prefix excluded.
  uint32_t maxFrameBytes = 4u << 20;
  /// Largest read data a command sequence may ask for, in bytes.
  uint32_t maxReadBytes = 1u << 20;
  /// A frame whose first byte has arrived must be complete within this time.
  uint32_t frameTimeoutMs = 10000;
  /// A reply must be taken by the client within this time.
  uint32_t writeTimeoutMs = 10000;
  /// A new connection must have done its TLS handshake, its hello and its token proof within
  /// this time (0: no limit).
  uint32_t greetingTimeoutMs = 5000;
  /// A connection that sends no frame for this long after its last reply is closed (0: never).
  uint32_t idleTimeoutMs = 60000;
  /// Clients connected at once. When a new one comes and all places are taken, the connection
  /// that has been waiting longest for its next request to arrive is closed to make room; when
  /// every connection has a request in progress, the new one is told the server is busy.
  uint32_t maxClients = 64;
  /// Announced to clients in the welcome.
  std::string name = "ZinNet target server";
  /// Receives one line per event (listening, connections opened and closed, refused frames).
  /// Null writes the lines to standard error.
  std::function<void(const std::string&)> log;
  /// Stop the server on SIGINT and SIGTERM.
  bool stopOnSignals = false;
  /// When not empty, every client must prove that it knows this token (an HMAC-SHA256 challenge
  /// and response, see docs/protocol.md) before any request is served. ZinNet::checkToken's
  /// limits apply.
  std::string token;
  /// Allows an address other than loopback without a token: whoever reaches the port drives the
  /// target. Without it, start() refuses such an address.
  bool insecure = false;
  /// Both set: clients must speak TLS; the certificate chain and its private key, PEM files.
  std::string tlsCertFile;
  std::string tlsKeyFile;
};

/// What a server has done so far.
struct ServerStats {
  uint64_t connectionsAccepted = 0;
  uint64_t connectionsOpen = 0;
  uint64_t requestsServed = 0;  // requests carried out on the transport
  uint64_t framesRefused = 0;   // malformed, oversized, truncated or timed-out frames
  uint64_t tokensRefused = 0;   // connections closed for a missing or wrong token proof
};

/// Serves `transport` to any number of clients. Each request is carried out whole and alone on
/// the transport, under one mutex: requests of different clients never interleave, and each
/// client's requests are carried out in the order sent. Every frame is treated as untrusted.
///
///   ZinNet::Server server(std::make_shared<ZinSim::Target>());
///   server.start();                              // 127.0.0.1, a free port
///   connect clients to server.port() ...
class ZINNET_API Server {
 public:
  explicit Server(std::shared_ptr<ZinRT::Zin_Transport> transport, ServerOptions options = {});
  /// Stops the server.
  ~Server();
  Server(const Server&) = delete;
  Server& operator=(const Server&) = delete;

  /// Binds, listens and serves on background threads. Throws std::runtime_error when the address
  /// cannot be bound, is not loopback while there is no token and `insecure` is false, or the
  /// token or the TLS files are unusable; std::logic_error when started twice.
  void start();
  /// Closes the listener and every connection; a request in progress finishes first. Idempotent.
  void stop();
  /// Blocks until the server has stopped (by stop() or a signal).
  void wait();
  bool isRunning() const;

  /// The bound port and "ADDRESS:PORT" (after start()).
  uint16_t port() const;
  std::string address() const;
  ServerStats stats() const;

  /// Runs `work` on the transport under the request mutex, between two requests.
  void withTransport(const std::function<void(ZinRT::Zin_Transport&)>& work);

 private:
  struct Impl;
  std::unique_ptr<Impl> impl_;
};

}  // namespace ZinNet

#endif
