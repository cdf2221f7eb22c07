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
#include "RequestHandler.h"
#include "ServerState.h"

namespace ZinNet {

/// Lives on the server's I/O thread. Requests run one at a time under the server's request mutex:
/// a small one at once on the I/O thread when no other request waits or runs, any other on the
/// request executor. A connection reads its next frame only after the reply to the previous one
/// is written, so a client cannot queue up work on the server.
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
  using Clock = std::chrono::steady_clock;

  void readNext();
  void readMore();
  void onRead(std::error_code ec, size_t n);
  void takeFrame();
  void readBody(uint32_t length);
  void onFrame(Frame frame);
  void onHello(const Frame& frame);
  void onPing(const Frame& frame);
  void runRequest(Frame frame);
  void finishRequest(Protocol::MessageType type, Reply reply);
  void send(std::vector<unsigned char> bytes, bool thenClose);
  void afterSend(std::error_code ec, bool thenClose);
  void lingerAndClose();
  void drain();
  void refuse(const std::string& why, bool thenClose);
  void armTimer(uint32_t ms, const char* what);
  void disarmTimer() { deadlineSet_ = false; }
  void startTimer(Clock::time_point at);
  void onTimer(std::error_code ec, uint64_t generation);
  void onReadError(std::error_code ec, const char* where);

  std::shared_ptr<ServerState> state_;
  asio::ip::tcp::socket socket_;
  asio::any_io_executor requests_;
  uint64_t id_;
  std::string peer_;
  uint16_t version_ = 0;  // agreed in the greeting
  // One timer per connection guards the current deadline. Moving the deadline later only
  // updates these fields; the timer, when it fires early, waits again for the rest. So the usual
  // exchange (the whole frame in one read, the reply in one write) sets no timer at all.
  asio::steady_timer timer_;
  uint64_t timerGeneration_ = 0;
  bool timerPending_ = false;
  Clock::time_point timerAt_{};
  bool deadlineSet_ = false;
  Clock::time_point deadline_{};
  uint32_t deadlineMs_ = 0;
  const char* deadlineWhat_ = "";
  // Bytes received and not yet taken: usually one whole small frame. A frame that does not fit
  // is completed in body_.
  std::array<unsigned char, 4096> head_{};
  size_t headBytes_ = 0;
  std::vector<unsigned char> body_;
  std::vector<unsigned char> outgoing_;
  static constexpr uint32_t kLingerMs = 1000;
  bool greeted_ = false;
  bool closed_ = false;
  bool leaving_ = false;     // a closing frame is being sent
  bool lingering_ = false;   // the closing frame is sent; waiting for the client to close
  bool inExchange_ = false;  // a request is queued, carried out or answered
  Clock::time_point lastExchange_ = Clock::now();
  uint64_t requestCount_ = 0;
};

}  // namespace ZinNet

#endif
