// Frame reading, greeting, request hand-off and reply writing of one client connection.
#include "ServerConnection.h"

#include <cstring>
#include <utility>

namespace ZinNet {

using Protocol::MessageType;

ServerConnection::ServerConnection(std::shared_ptr<ServerState> state, asio::ip::tcp::socket socket,
                                   asio::any_io_executor requests, uint64_t id)
    : state_(std::move(state)),
      stream_(std::move(socket)),
      requests_(std::move(requests)),
      id_(id),
      rules_(state_->options),
      timer_(stream_.get_executor()) {
  std::error_code ec;
  const auto remote = stream_.socket().remote_endpoint(ec);
  peer_ = ec ? std::string("an unknown peer")
             : remote.address().to_string() + ":" + std::to_string(remote.port());
  stream_.socket().set_option(asio::ip::tcp::no_delay(true), ec);
  // Replies are first written directly; only what the socket does not take at once waits.
  stream_.socket().non_blocking(true, ec);
  ++state_->connectionsOpen;
}

ServerConnection::~ServerConnection() {
  --state_->connectionsOpen;
}

void ServerConnection::start() {
  state_->log("connection " + std::to_string(id_) + " from " + peer_ + " opened");
  greetingDeadline_ = std::chrono::steady_clock::now() +
                      std::chrono::milliseconds(state_->options.greetingTimeoutMs);
  armGreetingTimer();
  if (!state_->tls) {
    readNext();
    return;
  }
  stream_.startTls(*state_->tls)
      .async_handshake(
          asio::ssl::stream_base::server,
          [self = shared_from_this()](std::error_code ec) { self->afterHandshake(ec); });
}

void ServerConnection::afterHandshake(std::error_code ec) {
  if (closed_) return;
  if (ec) {
    ++state_->framesRefused;
    close("TLS handshake failed: " + ec.message());
    return;
  }
  readNext();
}

// The handshake, the hello and the token proof share one deadline from the connection's start.
void ServerConnection::armGreetingTimer() {
  if (state_->options.greetingTimeoutMs == 0) {
    disarmTimer();
    return;
  }
  const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
      greetingDeadline_ - std::chrono::steady_clock::now());
  armTimer(static_cast<uint32_t>(std::max<int64_t>(1, left.count())), "the greeting",
           state_->options.greetingTimeoutMs);
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
  stream_.socket().shutdown(asio::ip::tcp::socket::shutdown_both, ec);
  stream_.socket().close(ec);
  state_->log("connection " + std::to_string(id_) + " closed after " +
              std::to_string(requestCount_) + " requests: " + why);
}

void ServerConnection::refuseAndClose(const std::string& why) {
  leaving_ = true;
  state_->log("connection from " + peer_ + " refused: " + why);
  if (state_->tls) {
    close(why);  // a TLS client could not read a frame sent before the handshake
    return;
  }
  send(textFrame(MessageType::Closing, why), true);
}

void ServerConnection::refuse(const std::string& why, bool thenClose) {
  ++state_->framesRefused;
  state_->log("connection " + std::to_string(id_) + ": " + why);
  leaving_ = leaving_ || thenClose;
  send(textFrame(thenClose ? MessageType::Closing : MessageType::Refused, why), thenClose);
}

void ServerConnection::armTimer(uint32_t ms, const char* what, uint32_t limitMs) {
  deadlineSet_ = ms != 0;
  if (!deadlineSet_) return;
  deadline_ = Clock::now() + std::chrono::milliseconds(ms);
  deadlineMs_ = limitMs == 0 ? ms : limitMs;
  deadlineWhat_ = what;
  if (!timerPending_ || timerAt_ > deadline_) startTimer(deadline_);
}

void ServerConnection::startTimer(Clock::time_point at) {
  const uint64_t generation = ++timerGeneration_;
  timerPending_ = true;
  timerAt_ = at;
  timer_.expires_at(at);
  timer_.async_wait([self = shared_from_this(), generation](std::error_code ec) {
    self->onTimer(ec, generation);
  });
}

void ServerConnection::onTimer(std::error_code ec, uint64_t generation) {
  if (ec || generation != timerGeneration_ || closed_) return;
  timerPending_ = false;
  if (!deadlineSet_) return;
  if (Clock::now() < deadline_) {
    startTimer(deadline_);  // the deadline moved on since the timer was set
  } else if (lingering_) {
    close("closed by the server");
  } else {
    ++state_->framesRefused;
    close(std::string(deadlineWhat_) + " not done within " + std::to_string(deadlineMs_) + " ms");
  }
}

void ServerConnection::onReadError(std::error_code ec, const char* where) {
  if (closed_) return;
  // A TLS client that closes without the layer's close notification truncates the stream.
  const bool ended = ec == asio::error::eof || ec == asio::error::connection_reset ||
                     ec == asio::ssl::error::stream_truncated;
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

// Reads the next frame. Bytes a client sent ahead of its reply wait in head_ and are taken only
// now, on a fresh handler (a client cannot make the server recurse).
void ServerConnection::readNext() {
  if (closed_) return;
  if (rules_.greeted()) {
    // Until the client is admitted, the greeting's deadline holds for every frame.
    if (!admitted_) {
      armGreetingTimer();
    } else if (headBytes_ == 0) {
      armTimer(state_->options.idleTimeoutMs, "waiting for a frame");
    } else {
      armTimer(state_->options.frameTimeoutMs, "a frame");
    }
    if (headBytes_ != 0) {
      asio::post(stream_.get_executor(), [self = shared_from_this()] { self->takeFrame(); });
      return;
    }
  }
  readMore();
}

void ServerConnection::readMore() {
  stream_.async_read_some(
      asio::buffer(head_.data() + headBytes_, head_.size() - headBytes_),
      [self = shared_from_this()](std::error_code ec, size_t n) { self->onRead(ec, n); });
}

void ServerConnection::onRead(std::error_code ec, size_t n) {
  if (ec) {
    onReadError(ec, headBytes_ == 0                       ? "between frames"
                    : headBytes_ < Protocol::kLengthBytes ? "inside a frame's length"
                                                          : "inside a frame");
    return;
  }
  if (headBytes_ == 0 && n != 0 && admitted_) {
    armTimer(state_->options.frameTimeoutMs, "a frame");
  }
  headBytes_ += n;
  takeFrame();
}

void ServerConnection::takeFrame() {
  if (closed_) return;
  if (headBytes_ < Protocol::kLengthBytes) {
    readMore();
    return;
  }
  const uint32_t length = decodeLength(head_.data());
  // Between the hello and the token proof only the small token frames may come.
  const std::string problem =
      rules_.greeted() && !admitted_ && length > kMaxTokenFrame
          ? "frame of " + std::to_string(length) + " bytes exceeds the limit of " +
                std::to_string(kMaxTokenFrame) + " bytes"
          : rules_.lengthProblem(length);
  if (!problem.empty()) {
    refuse(problem, true);
    return;
  }
  const size_t end = Protocol::kLengthBytes + size_t{length};
  if (end > headBytes_) {
    readBody(length);
    return;
  }
  Frame frame;
  frame.type = static_cast<MessageType>(head_[Protocol::kLengthBytes]);
  frame.body.assign(head_.begin() + Protocol::kLengthBytes + 1, head_.begin() + end);
  std::memmove(head_.data(), head_.data() + end, headBytes_ - end);
  headBytes_ -= end;
  onFrame(std::move(frame));
}

// A frame larger than what has arrived: its start moves to body_, the rest is read into it.
void ServerConnection::readBody(uint32_t length) {
  const size_t have = headBytes_ - Protocol::kLengthBytes;
  body_.assign(length, 0);
  std::memcpy(body_.data(), head_.data() + Protocol::kLengthBytes, have);
  headBytes_ = 0;
  asio::async_read(stream_, asio::buffer(body_.data() + have, length - have),
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
  if (rules_.greeted() && !admitted_) {
    onTokenStep(frame);
    return;
  }
  const bool greeted = rules_.greeted();
  FrameOutcome outcome = rules_.onFrame(frame);
  if (!greeted && rules_.greeted()) admitted_ = state_->options.token.empty();
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
  const MessageType type = frame.type;
  const size_t bodyBytes = frame.body.size();
  // A small request with nothing ahead of it runs at once, here: no hand-off to another thread
  // and back. The I/O thread never waits for the request mutex.
  if (bodyBytes <= RequestQueue::kSmallRequestBytes && state_->handedOff == 0) {
    std::unique_lock<std::mutex> lock(state_->requestMutex, std::try_to_lock);
    if (lock.owns_lock()) {
      Reply reply = carryOut(frame, *state_->transport, state_->options.maxReadBytes);
      lock.unlock();
      finishRequest(type, std::move(reply));
      return;
    }
  }
  // Otherwise it waits its turn for the request executor; the reply comes back to the I/O
  // thread. Each post takes one request from the queue, the small ones first.
  ++state_->handedOff;
  state_->waiting.push(bodyBytes, [self = shared_from_this(), type, frame = std::move(frame)]() {
    if (self->state_->stopping) {
      --self->state_->handedOff;
      return;
    }
    Reply reply;
    {
      std::lock_guard<std::mutex> lock(self->state_->requestMutex);
      reply = carryOut(frame, *self->state_->transport, self->state_->options.maxReadBytes);
    }
    --self->state_->handedOff;
    asio::post(self->stream_.get_executor(), [self, type, reply = std::move(reply)]() mutable {
      self->finishRequest(type, std::move(reply));
    });
  });
  asio::post(requests_, [state = state_]() {
    if (auto job = state->waiting.pop()) job();
  });
}

void ServerConnection::finishRequest(MessageType type, Reply reply) {
  if (reply.carriedOut) {
    ++state_->requestsServed;
    ++requestCount_;
  }
  if (reply.refused) {
    ++state_->framesRefused;
    state_->log("connection " + std::to_string(id_) + ": refused a malformed " +
                typeText(static_cast<uint8_t>(type)) + " request");
  }
  send(std::move(reply.bytes), false);
}

void ServerConnection::lingerAndClose() {
  // Stop sending, then drop what the client still sends until it closes too (bounded by a
  // timer), so that the closing frame is not lost to a reset caused by unread bytes.
  std::error_code ec;
  stream_.socket().shutdown(asio::ip::tcp::socket::shutdown_send, ec);
  lingering_ = true;
  armTimer(kLingerMs, "closing");
  drain();
}

void ServerConnection::drain() {
  stream_.async_read_some(asio::buffer(head_),
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
  // Most replies fit the socket's buffer and are written at once, without a timer. A TLS
  // layer keeps records of its own, so its replies always take the asynchronous path.
  std::error_code ec;
  size_t written = 0;
  if (!stream_.secure()) {
    written = stream_.socket().write_some(asio::buffer(bytes), ec);
    if ((!ec && written == bytes.size()) ||
        (ec && ec != asio::error::would_block && ec != asio::error::try_again)) {
      afterSend(ec, thenClose);
      return;
    }
  }
  outgoing_ = std::move(bytes);
  armTimer(state_->options.writeTimeoutMs, "sending a reply");
  asio::async_write(stream_, asio::buffer(outgoing_.data() + written, outgoing_.size() - written),
                    [self = shared_from_this(), thenClose](std::error_code e, size_t) {
                      if (self->closed_) return;
                      self->outgoing_ = {};  // no reply is kept between requests
                      self->afterSend(e, thenClose);
                    });
}

void ServerConnection::afterSend(std::error_code ec, bool thenClose) {
  disarmTimer();
  if (ec) {
    close("write failed: " + ec.message());
  } else if (thenClose) {
    lingerAndClose();
  } else {
    inExchange_ = false;
    lastExchange_ = Clock::now();
    readNext();
  }
}

}  // namespace ZinNet
