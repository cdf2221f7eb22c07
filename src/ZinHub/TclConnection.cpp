// OpenOCD's Tcl server over a plain TCP socket with poll() deadlines.
#include "ZinHub/TclConnection.h"

#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstring>
#include <stdexcept>

namespace ZinHub {

namespace {

using Clock = std::chrono::steady_clock;
constexpr char kEnd = '\x1a';

int msLeft(Clock::time_point deadline) {
  const auto left =
      std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
  return left > 0 ? static_cast<int>(left) : 0;
}

// Waits until `fd` is ready for `events`; false at the deadline.
bool waitFor(int fd, short events, Clock::time_point deadline) {
  while (true) {
    pollfd p{fd, events, 0};
    const int n = poll(&p, 1, msLeft(deadline));
    if (n > 0) return true;
    if (n == 0) return false;
    if (errno != EINTR) return false;
  }
}

}  // namespace

TclConnection::TclConnection(std::string host, uint16_t port, OpenOcdOptions options)
    : host_(std::move(host)), port_(port), options_(options) {}

TclConnection::~TclConnection() {
  close();
}

std::string TclConnection::where() const {
  const bool v6 = host_.find(':') != std::string::npos;
  return "OpenOCD at " + (v6 ? "[" + host_ + "]" : host_) + ":" + std::to_string(port_);
}

void TclConnection::close() {
  if (fd_ >= 0) ::close(fd_);
  fd_ = -1;
}

void TclConnection::fail(const std::string& what) {
  close();
  throw std::runtime_error("ZinHub: " + where() + ": " + what);
}

bool TclConnection::closedByPeer() const {
  // An idle connection has nothing to read: the end of the stream or stray bytes mean it cannot
  // carry a request any more.
  char byte = 0;
  const ssize_t n = recv(fd_, &byte, 1, MSG_PEEK | MSG_DONTWAIT);
  return !(n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK));
}

bool TclConnection::ensureConnected() {
  if (fd_ >= 0 && closedByPeer()) close();
  if (fd_ >= 0) return false;
  connectNow();
  return true;
}

void TclConnection::connectNow() {
  const auto deadline = Clock::now() + std::chrono::milliseconds(options_.connectTimeoutMs);
  addrinfo hints{};
  hints.ai_family = AF_UNSPEC;
  hints.ai_socktype = SOCK_STREAM;
  addrinfo* found = nullptr;
  const int rc = getaddrinfo(host_.c_str(), std::to_string(port_).c_str(), &hints, &found);
  if (rc != 0) fail(std::string("cannot find the host: ") + gai_strerror(rc));
  std::string error = "no address";
  for (addrinfo* a = found; a != nullptr && fd_ < 0; a = a->ai_next) {
    fd_ = socket(a->ai_family, a->ai_socktype | SOCK_CLOEXEC | SOCK_NONBLOCK, a->ai_protocol);
    if (fd_ < 0) continue;
    if (::connect(fd_, a->ai_addr, a->ai_addrlen) != 0 && errno != EINPROGRESS) {
      error = std::strerror(errno);
      close();
      continue;
    }
    if (!waitFor(fd_, POLLOUT, deadline)) {
      error = "no answer within " + std::to_string(options_.connectTimeoutMs) + " ms";
      close();
      continue;
    }
    int soError = 0;
    socklen_t length = sizeof soError;
    getsockopt(fd_, SOL_SOCKET, SO_ERROR, &soError, &length);
    if (soError != 0) {
      error = std::strerror(soError);
      close();
    }
  }
  freeaddrinfo(found);
  if (fd_ < 0) fail("cannot connect: " + error + " (is OpenOCD running with its Tcl port there?)");
  const int one = 1;
  setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
}

std::string TclConnection::request(const std::string& script, size_t maxAnswer) {
  if (script.find(kEnd) != std::string::npos) fail("a request must not contain the byte 0x1a");
  ensureConnected();
  const auto deadline = Clock::now() + std::chrono::milliseconds(options_.requestTimeoutMs);
  const std::string late =
      "no answer within " + std::to_string(options_.requestTimeoutMs) + " ms; connection closed";
  std::string out = script + kEnd;
  for (size_t sent = 0; sent < out.size();) {
    if (!waitFor(fd_, POLLOUT, deadline)) fail(late);
    const ssize_t n = send(fd_, out.data() + sent, out.size() - sent, MSG_NOSIGNAL);
    if (n < 0 && errno != EAGAIN && errno != EINTR) {
      fail(std::string("connection lost while sending: ") + std::strerror(errno));
    }
    if (n > 0) sent += static_cast<size_t>(n);
  }
  std::string answer;
  char buffer[65536];
  while (answer.empty() || answer.back() != kEnd) {
    if (answer.size() > maxAnswer)
      fail("answer longer than " + std::to_string(maxAnswer) + " bytes");
    if (!waitFor(fd_, POLLIN, deadline)) fail(late);
    const ssize_t n = recv(fd_, buffer, sizeof buffer, 0);
    if (n == 0) fail("OpenOCD closed the connection (did it stop?)");
    if (n < 0 && errno != EAGAIN && errno != EINTR) {
      fail(std::string("connection lost: ") + std::strerror(errno));
    }
    if (n > 0) answer.append(buffer, static_cast<size_t>(n));
  }
  answer.pop_back();
  if (answer.find(kEnd) != std::string::npos) fail("more than one answer to one request");
  return answer;
}

}  // namespace ZinHub
