// One client connection of the server: reads frames, has requests carried out, writes replies.
#ifndef ZINNET_SRC_SERVERCONNECTION_H
#define ZINNET_SRC_SERVERCONNECTION_H

#include <array>
#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "Asio.h"
#include "Frame.h"
#include "NetStream.h"
#include "ServerState.h"
#include "TokenProof.h"

namespace ZinNet {

/// Lives on the server's I/O thread; the requests themselves run on the request executor, one at
/// a time under the server's request mutex. A connection reads its next frame only after the reply
/// to the previous one is written, so a client cannot queue up work on the server.
class ServerConnection : public std::enable_shared_from_this<ServerConnection> {
 public:
  ServerConnection(std::shared_ptr<ServerState> state, asio::ip::tcp::socket socket,
                   asio::any_io_executor requests, uint64_t id);
  ~ServerConnection();

  /// Starts reading frames.
  void start();
  /// Sends a closing frame with `why`, then closes (used for a server that is full).
  void refuseAndClose(const std::string& why);
  /// Closes the socket now.
  void close(const std::string& why);
  /// Whether the connection holds a place: open and not on its way out.
  bool holdsPlace() const { return !closed_ && !leaving_; }
  /// Whether it may be closed to make room: no request of it is queued, carried out or being
  /// answered. `since` is when it last completed an exchange (or connected).
  bool evictable(std::chrono::steady_clock::time_point& since) const;

 private:
  void readPrefix();
  void onPrefix(std::error_code ec, size_t n);
  void readBody(uint32_t length);
  void onFrame(Frame frame);
  void onHello(const Frame& frame);
  void onTokenStep(const Frame& frame);
  void onTokenRequest(const Frame& frame);
  void onTokenProof(const Frame& frame);
  void refuseToken(const std::string& why);
  void afterHandshake(std::error_code ec);
  void armGreetingTimer();
  void runRequest(Frame frame);
  void send(std::vector<unsigned char> bytes, bool thenClose);
  void lingerAndClose();
  void drain();
  void refuse(const std::string& why, bool thenClose);
  /// Closes the connection unless disarmed within `ms`; the message names `limitMs` (else `ms`).
  void armTimer(uint32_t ms, const char* what, uint32_t limitMs = 0);
  void disarmTimer();
  void onReadError(std::error_code ec, const char* where);

  std::shared_ptr<ServerState> state_;
  NetStream stream_;
  asio::steady_timer timer_;
  asio::any_io_executor requests_;
  uint64_t id_;
  std::string peer_;
  uint64_t timerGeneration_ = 0;
  std::array<unsigned char, Protocol::kLengthBytes> prefix_{};
  size_t prefixBytes_ = 0;
  std::vector<unsigned char> body_;
  std::vector<unsigned char> outgoing_;
  std::array<unsigned char, 4096> scratch_{};
  static constexpr uint32_t kLingerMs = 1000;
  static constexpr uint32_t kMaxTokenFrame = 64;  // the token frames have 33 bytes
  bool greeted_ = false;
  bool admitted_ = false;    // greeted, and the token proven when the server has one
  bool challenged_ = false;  // a token challenge was sent
  Nonce clientNonce_{};
  Nonce serverNonce_{};
  std::chrono::steady_clock::time_point greetingDeadline_{};
  bool closed_ = false;
  bool leaving_ = false;     // a closing frame is being sent
  bool inExchange_ = false;  // a request is queued, carried out or answered
  std::chrono::steady_clock::time_point lastExchange_ = std::chrono::steady_clock::now();
  uint64_t requestCount_ = 0;
};

}  // namespace ZinNet

#endif
