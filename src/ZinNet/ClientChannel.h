// The client's connection to a server: connect and greet, then frame exchanges, each bounded by
// a deadline. Any failure closes the connection.
#ifndef ZINNET_SRC_CLIENTCHANNEL_H
#define ZINNET_SRC_CLIENTCHANNEL_H

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "Asio.h"
#include "Frame.h"
#include "ZinNet/Endpoint.h"
#include "ZinNet/TcpTransport.h"

namespace ZinNet {

class ClientChannel {
 public:
  ClientChannel(Endpoint endpoint, ClientOptions options);
  ~ClientChannel();

  /// Connects and greets unless connected; also notices a connection the server closed while
  /// it was idle, and connects again. Throws NetError.
  void ensureConnected();
  void disconnect();
  bool isConnected() const { return connected_; }

  /// Sends one request frame and returns the reply. A target failure throws TargetError and a
  /// refusal NetError, both keeping the connection; every other fault closes it and throws
  /// NetError. `what` names the request in messages ("a command sequence").
  Frame exchange(const std::vector<unsigned char>& request, Protocol::MessageType expected,
                 const char* what);

  const std::string& serverName() const { return serverName_; }
  uint32_t serverMaxFrame() const { return serverMaxFrame_; }
  uint32_t serverMaxRead() const { return serverMaxRead_; }
  std::string serverText() const { return endpoint_.text(); }
  /// The protocol version agreed in the greeting.
  uint16_t version() const { return version_; }

 private:
  using Clock = std::chrono::steady_clock;
  struct OpState;

  void connectNow();
  /// False when the server refused `version` and an older one is left to try.
  bool greet(Clock::time_point deadline, uint16_t version);
  bool closedByPeer();
  void await(const std::shared_ptr<OpState>& state, Clock::time_point deadline,
             const std::string& what, uint32_t timeoutMs);
  void writeAll(const std::vector<unsigned char>& bytes, Clock::time_point deadline,
                const std::string& what, uint32_t timeoutMs);
  Frame readFrame(Clock::time_point deadline, const std::string& what, uint32_t timeoutMs);
  [[noreturn]] void fail(const std::string& text);

  Endpoint endpoint_;
  ClientOptions options_;
  asio::io_context io_;
  asio::ip::tcp::resolver resolver_;
  asio::ip::tcp::socket socket_;
  bool connected_ = false;
  std::string serverName_;
  uint32_t serverMaxFrame_ = 0;
  uint32_t serverMaxRead_ = 0;
  uint16_t version_ = 0;
};

}  // namespace ZinNet

#endif
