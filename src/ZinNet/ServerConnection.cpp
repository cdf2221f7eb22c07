// Frame reading, greeting, request hand-off and reply writing of one client connection.
#include "ServerConnection.h"

#include <cstring>
#include <utility>

#include "RequestHandler.h"

namespace ZinNet {

using Protocol::MessageType;

ServerConnection::ServerConnection(std::shared_ptr<ServerState> state, asio::ip::tcp::socket socket,
                                   asio::any_io_executor requests, uint64_t id)
    : state_(std::move(state)),
      socket_(std::move(socket)),
      timer_(socket_.get_executor()),
      requests_(std::move(requests)),
      id_(id),
      rules_(state_->options) {
  std::error_code ec;
  const auto remote = socket_.remote_endpoint(ec);
  peer_ = ec ? std::string("an unknown peer")
             : remote.address().to_string() + ":" + std::to_string(remote.port());
  socket_.set_option(asio::ip::tcp::no_delay(true), ec);
  ++state_->connectionsOpen;
}

ServerConnection::~ServerConnection() {
  --state_->connectionsOpen;
}

void ServerConnection::start() {
  state_->log("connection " + std::to_string(id_) + " from " + peer_ + " opened");
  armTimer(state_->options.greetingTimeoutMs, "the greeting");
  readPrefix();
}

bool ServerConnection::evictable(std::chrono::steady_clock::time_point& since) const {
  since = lastExchange_;
  return holdsPlace() && !inExchange_;
}

void ServerConnection::close(const std::string& why) {
  if (closed_) return;
  closed_ = true;
  std::error_code ec;
  timer_.cancel();
  socket_.shutdown(asio::ip::tcp::socket::shutdown_both, ec);
  socket_.close(ec);
  state_->log("connection " + std::to_string(id_) + " closed after " +
              std::to_string(requestCount_) + " requests: " + why);
}

void ServerConnection::refuseAndClose(const std::string& why) {
  leaving_ = true;
  state_->log("connection from " + peer_ + " refused: " + why);
  send(textFrame(MessageType::Closing, why), true);
}

void ServerConnection::refuse(const std::string& why, bool thenClose) {
  ++state_->framesRefused;
  state_->log("connection " + std::to_string(id_) + ": " + why);
  leaving_ = leaving_ || thenClose;
  send(textFrame(thenClose ? MessageType::Closing : MessageType::Refused, why), thenClose);
}

void ServerConnection::armTimer(uint32_t ms, const char* what) {
  const uint64_t generation = ++timerGeneration_;
  timer_.cancel();
  if (ms == 0) return;
  timer_.expires_after(std::chrono::milliseconds(ms));
  timer_.async_wait([self = shared_from_this(), generation, ms, what](std::error_code ec) {
    if (ec || generation != self->timerGeneration_ || self->closed_) return;
    ++self->state_->framesRefused;
    self->close(std::string(what) + " not done within " + std::to_string(ms) + " ms");
  });
}

void ServerConnection::disarmTimer() {
  ++timerGeneration_;
  timer_.cancel();
}

void ServerConnection::onReadError(std::error_code ec, const char* where) {
  if (closed_) return;
  const bool ended = ec == asio::error::eof || ec == asio::error::connection_reset;
  if (ended && std::strcmp(where, "between frames") == 0) {
    close("the client closed the connection");
    return;
  }
  ++state_->framesRefused;  // a truncated frame
  if (ended) {
    close(std::string("the client closed the connection ") + where);
  } else {
    close(std::string("read failed ") + where + ": " + ec.message());
  }
}

void ServerConnection::readPrefix() {
  if (closed_) return;
  // Before the hello, the greeting timer armed at the start runs on.
  if (prefixBytes_ == 0 && rules_.greeted()) {
    armTimer(state_->options.idleTimeoutMs, "waiting for a frame");
  }
  socket_.async_read_some(
      asio::buffer(prefix_.data() + prefixBytes_, prefix_.size() - prefixBytes_),
      [self = shared_from_this()](std::error_code ec, size_t n) { self->onPrefix(ec, n); });
}

void ServerConnection::onPrefix(std::error_code ec, size_t n) {
  if (ec) {
    onReadError(ec, prefixBytes_ == 0 ? "between frames" : "inside a frame's length");
    return;
  }
  if (prefixBytes_ == 0 && n != 0 && rules_.greeted()) {
    armTimer(state_->options.frameTimeoutMs, "a frame");
  }
  prefixBytes_ += n;
  if (prefixBytes_ < prefix_.size()) {
    readPrefix();
    return;
  }
  prefixBytes_ = 0;
  const uint32_t length = decodeLength(prefix_.data());
  const std::string problem = rules_.lengthProblem(length);
  if (!problem.empty()) {
    refuse(problem, true);
  } else {
    readBody(length);
  }
}

void ServerConnection::readBody(uint32_t length) {
  body_.assign(length, 0);
  asio::async_read(socket_, asio::buffer(body_),
                   [self = shared_from_this()](std::error_code ec, size_t) {
                     if (ec) {
                       self->onReadError(ec, "inside a frame");
                       return;
                     }
                     // The body moves on without a copy, and the buffer keeps no memory between
                     // frames.
                     self->onFrame(frameOf(std::exchange(self->body_, {})));
                   });
}

void ServerConnection::onFrame(Frame frame) {
  if (closed_) return;
  disarmTimer();
  inExchange_ = true;
  FrameOutcome outcome = rules_.onFrame(frame);
  switch (outcome.action) {
    case FrameOutcome::Action::Request:
      runRequest(std::move(frame));
      break;
    case FrameOutcome::Action::Reply:
      send(std::move(outcome.bytes), false);
      break;
    case FrameOutcome::Action::Refuse:
      refuse(outcome.why, false);
      break;
    case FrameOutcome::Action::Close:
      refuse(outcome.why, true);
      break;
  }
}

void ServerConnection::runRequest(Frame frame) {
  // The request runs on the request executor; the reply comes back to the I/O thread.
  // Each post takes one request from the queue, the small ones first.
  const MessageType type = frame.type;
  const size_t bodyBytes = frame.body.size();
  state_->waiting.push(bodyBytes, [self = shared_from_this(), type, frame = std::move(frame)]() {
    if (self->state_->stopping) return;
    Reply reply;
    {
      std::lock_guard<std::mutex> lock(self->state_->requestMutex);
      reply = carryOut(frame, *self->state_->transport, self->state_->options.maxReadBytes);
    }
    asio::post(self->socket_.get_executor(), [self, type, reply = std::move(reply)]() mutable {
      if (reply.carriedOut) {
        ++self->state_->requestsServed;
        ++self->requestCount_;
      }
      if (reply.refused) {
        ++self->state_->framesRefused;
        self->state_->log("connection " + std::to_string(self->id_) + ": refused a malformed " +
                          typeText(static_cast<uint8_t>(type)) + " request");
      }
      self->send(std::move(reply.bytes), false);
    });
  });
  asio::post(requests_, [state = state_]() {
    if (auto job = state->waiting.pop()) job();
  });
}

void ServerConnection::lingerAndClose() {
  // Stop sending, then drop what the client still sends until it closes too (bounded by a
  // timer), so that the closing frame is not lost to a reset caused by unread bytes.
  std::error_code ec;
  socket_.shutdown(asio::ip::tcp::socket::shutdown_send, ec);
  const uint64_t generation = ++timerGeneration_;
  timer_.expires_after(std::chrono::milliseconds(kLingerMs));
  timer_.async_wait([self = shared_from_this(), generation](std::error_code e) {
    if (!e && generation == self->timerGeneration_) self->close("closed by the server");
  });
  drain();
}

void ServerConnection::drain() {
  socket_.async_read_some(asio::buffer(scratch_),
                          [self = shared_from_this()](std::error_code ec, size_t) {
                            if (self->closed_) return;
                            if (ec) {
                              self->close("closed by the server");
                            } else {
                              self->drain();
                            }
                          });
}

void ServerConnection::send(std::vector<unsigned char> bytes, bool thenClose) {
  if (closed_) return;
  outgoing_ = std::move(bytes);
  armTimer(state_->options.writeTimeoutMs, "sending a reply");
  asio::async_write(socket_, asio::buffer(outgoing_),
                    [self = shared_from_this(), thenClose](std::error_code ec, size_t) {
                      if (self->closed_) return;
                      self->disarmTimer();
                      self->outgoing_ = {};  // no reply is kept between requests
                      if (ec) {
                        self->close("write failed: " + ec.message());
                      } else if (thenClose) {
                        self->lingerAndClose();
                      } else {
                        self->inExchange_ = false;
                        self->lastExchange_ = std::chrono::steady_clock::now();
                        self->readPrefix();
                      }
                    });
}

}  // namespace ZinNet
