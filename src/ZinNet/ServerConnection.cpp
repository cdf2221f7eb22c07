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
      stream_(std::move(socket)),
      timer_(stream_.get_executor()),
      requests_(std::move(requests)),
      id_(id) {
  std::error_code ec;
  const auto remote = stream_.socket().remote_endpoint(ec);
  peer_ = ec ? std::string("an unknown peer")
             : remote.address().to_string() + ":" + std::to_string(remote.port());
  stream_.socket().set_option(asio::ip::tcp::no_delay(true), ec);
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
    readPrefix();
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
  readPrefix();
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
  const uint64_t generation = ++timerGeneration_;
  timer_.cancel();
  if (ms == 0) return;
  if (limitMs == 0) limitMs = ms;
  timer_.expires_after(std::chrono::milliseconds(ms));
  timer_.async_wait([self = shared_from_this(), generation, limitMs, what](std::error_code ec) {
    if (ec || generation != self->timerGeneration_ || self->closed_) return;
    ++self->state_->framesRefused;
    self->close(std::string(what) + " not done within " + std::to_string(limitMs) + " ms");
  });
}

void ServerConnection::disarmTimer() {
  ++timerGeneration_;
  timer_.cancel();
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

void ServerConnection::readPrefix() {
  if (closed_) return;
  // Until the client is admitted, the greeting's deadline holds for every frame.
  if (prefixBytes_ == 0) {
    if (admitted_) {
      armTimer(state_->options.idleTimeoutMs, "waiting for a frame");
    } else {
      armGreetingTimer();
    }
  }
  stream_.async_read_some(
      asio::buffer(prefix_.data() + prefixBytes_, prefix_.size() - prefixBytes_),
      [self = shared_from_this()](std::error_code ec, size_t n) { self->onPrefix(ec, n); });
}

void ServerConnection::onPrefix(std::error_code ec, size_t n) {
  if (ec) {
    onReadError(ec, prefixBytes_ == 0 ? "between frames" : "inside a frame's length");
    return;
  }
  if (prefixBytes_ == 0 && n != 0 && admitted_) {
    armTimer(state_->options.frameTimeoutMs, "a frame");
  }
  prefixBytes_ += n;
  if (prefixBytes_ < prefix_.size()) {
    readPrefix();
    return;
  }
  prefixBytes_ = 0;
  const uint32_t length = decodeLength(prefix_.data());
  // Between the hello and the token proof only the small token frames may come.
  const uint32_t limit = greeted_ && !admitted_ ? kMaxTokenFrame : state_->options.maxFrameBytes;
  if (length == 0) {
    refuse("frame of length 0", true);
  } else if (length > limit) {
    refuse("frame of " + std::to_string(length) + " bytes exceeds the limit of " +
               std::to_string(limit) + " bytes",
           true);
  } else {
    readBody(length);
  }
}

void ServerConnection::readBody(uint32_t length) {
  body_.assign(length, 0);
  asio::async_read(stream_, asio::buffer(body_),
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
  } else if (!admitted_) {
    onTokenStep(frame);
  } else if (frame.type == MessageType::Hello) {
    refuse("hello sent twice", false);
  } else if (frame.type == MessageType::TokenRequest) {
    refuse(state_->options.token.empty() ? "this server asks for no token"
                                         : "the token was already proven",
           false);
  } else if (!isRequest(frame.type)) {
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
  if (version != Protocol::kVersion) {
    refuse("protocol version " + std::to_string(version) +
               " is not supported; this server speaks " + std::to_string(Protocol::kVersion),
           true);
    return;
  }
  greeted_ = true;
  admitted_ = state_->options.token.empty();
  FrameWriter out(MessageType::Welcome);
  out.bytes(Protocol::kMagic, 4).u16(Protocol::kVersion);
  out.u32(state_->options.maxFrameBytes).u32(state_->options.maxReadBytes);
  send(out.text(boundedText(state_->options.name)).finish(), false);
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
    asio::post(self->stream_.get_executor(), [self, type, reply = std::move(reply)]() mutable {
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
  stream_.socket().shutdown(asio::ip::tcp::socket::shutdown_send, ec);
  const uint64_t generation = ++timerGeneration_;
  timer_.expires_after(std::chrono::milliseconds(kLingerMs));
  timer_.async_wait([self = shared_from_this(), generation](std::error_code e) {
    if (!e && generation == self->timerGeneration_) self->close("closed by the server");
  });
  drain();
}

void ServerConnection::drain() {
  stream_.async_read_some(asio::buffer(scratch_),
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
  asio::async_write(stream_, asio::buffer(outgoing_),
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
