// Frame reading, greeting, request hand-off and reply writing of one client connection.
#include "ServerConnection.h"

#include <cstring>
#include <utility>

namespace ZinNet {

using Protocol::MessageType;

ServerConnection::ServerConnection(std::shared_ptr<ServerState> state, asio::ip::tcp::socket socket,
                                   asio::any_io_executor requests, uint64_t id)
    : state_(std::move(state)),
      socket_(std::move(socket)),
      requests_(std::move(requests)),
      id_(id),
      timer_(socket_.get_executor()) {
  std::error_code ec;
  const auto remote = socket_.remote_endpoint(ec);
  peer_ = ec ? std::string("an unknown peer")
             : remote.address().to_string() + ":" + std::to_string(remote.port());
  socket_.set_option(asio::ip::tcp::no_delay(true), ec);
  // Replies are first written directly; only what the socket does not take at once waits.
  socket_.non_blocking(true, ec);
  ++state_->connectionsOpen;
}

ServerConnection::~ServerConnection() {
  --state_->connectionsOpen;
}

void ServerConnection::start() {
  state_->log("connection " + std::to_string(id_) + " from " + peer_ + " opened");
  armTimer(state_->options.greetingTimeoutMs, "the greeting");
  readNext();
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
  deadlineSet_ = ms != 0;
  if (!deadlineSet_) return;
  deadline_ = Clock::now() + std::chrono::milliseconds(ms);
  deadlineMs_ = ms;
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

// Reads the next frame. Bytes a client sent ahead of its reply wait in head_ and are taken only
// now, on a fresh handler (a client cannot make the server recurse).
void ServerConnection::readNext() {
  if (closed_) return;
  if (greeted_) {
    if (headBytes_ == 0) {
      armTimer(state_->options.idleTimeoutMs, "waiting for a frame");
    } else {
      armTimer(state_->options.frameTimeoutMs, "a frame");
      asio::post(socket_.get_executor(), [self = shared_from_this()] { self->takeFrame(); });
      return;
    }
  }
  readMore();
}

void ServerConnection::readMore() {
  socket_.async_read_some(
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
  if (headBytes_ == 0 && n != 0 && greeted_) {
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
  if (length == 0) {
    refuse("frame of length 0", true);
    return;
  }
  if (length > state_->options.maxFrameBytes) {
    refuse("frame of " + std::to_string(length) + " bytes exceeds the limit of " +
               std::to_string(state_->options.maxFrameBytes) + " bytes",
           true);
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
  asio::async_read(socket_, asio::buffer(body_.data() + have, length - have),
                   [self = shared_from_this()](std::error_code ec, size_t) {
                     if (ec) {
                       self->onReadError(ec, "inside a frame");
                       return;
                     }
                     // The body moves on without a copy, and the buffer keeps no memory between
                     // frames.
                     Frame frame;
                     frame.type = static_cast<MessageType>(self->body_.front());
                     self->body_.erase(self->body_.begin());
                     frame.body = std::exchange(self->body_, {});
                     self->onFrame(std::move(frame));
                   });
}

void ServerConnection::onFrame(Frame frame) {
  if (closed_) return;
  disarmTimer();
  inExchange_ = true;
  if (!greeted_) {
    onHello(frame);
  } else if (frame.type == MessageType::Hello) {
    refuse("hello sent twice", false);
  } else if (frame.type == MessageType::Ping && version_ >= 2) {
    onPing(frame);
  } else if (!isRequest(frame.type, version_)) {
    refuse("unknown request type " + typeText(static_cast<uint8_t>(frame.type)), false);
  } else {
    runRequest(std::move(frame));
  }
}

void ServerConnection::onHello(const Frame& frame) {
  if (frame.type != MessageType::Hello) {
    refuse("expected a hello frame first, got " + typeText(static_cast<uint8_t>(frame.type)), true);
    return;
  }
  FrameReader in(frame, "hello");
  if (in.remaining() != 6 || std::memcmp(in.bytes(4), Protocol::kMagic, 4) != 0) {
    refuse("not a ZinNet hello", true);
    return;
  }
  const uint16_t version = in.u16();
  if (version < Protocol::kOldestVersion || version > Protocol::kVersion) {
    refuse("protocol version " + std::to_string(version) +
               " is not supported; this server speaks " + std::to_string(Protocol::kOldestVersion) +
               " and " + std::to_string(Protocol::kVersion),
           true);
    return;
  }
  greeted_ = true;
  version_ = version;
  FrameWriter out(MessageType::Welcome);
  out.bytes(Protocol::kMagic, 4).u16(version);
  out.u32(state_->options.maxFrameBytes).u32(state_->options.maxReadBytes);
  send(out.text(boundedText(state_->options.name)).finish(), false);
}

// Answered on the I/O thread: a ping measures the way to the server and back, not the target.
void ServerConnection::onPing(const Frame& frame) {
  try {
    FrameReader(frame, "ping").end();
  } catch (const FrameError& e) {
    refuse(e.what(), false);
    return;
  }
  send(FrameWriter(MessageType::Pong).finish(), false);
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
    asio::post(self->socket_.get_executor(), [self, type, reply = std::move(reply)]() mutable {
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
  socket_.shutdown(asio::ip::tcp::socket::shutdown_send, ec);
  lingering_ = true;
  armTimer(kLingerMs, "closing");
  drain();
}

void ServerConnection::drain() {
  socket_.async_read_some(asio::buffer(head_),
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
  // Most replies fit the socket's buffer and are written at once, without a timer.
  std::error_code ec;
  const size_t written = socket_.write_some(asio::buffer(bytes), ec);
  if (!ec && written == bytes.size()) {
    afterSend(ec, thenClose);
    return;
  }
  if (ec && ec != asio::error::would_block && ec != asio::error::try_again) {
    afterSend(ec, thenClose);
    return;
  }
  outgoing_ = std::move(bytes);
  armTimer(state_->options.writeTimeoutMs, "sending a reply");
  asio::async_write(socket_, asio::buffer(outgoing_.data() + written, outgoing_.size() - written),
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
