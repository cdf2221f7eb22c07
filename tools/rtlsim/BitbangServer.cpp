// A remote bit-bang JTAG server on a loopback TCP port.
#include "BitbangServer.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace ZinRtl {

namespace {

constexpr int kPollMs = 100;
constexpr size_t kChunk = 4096;  // bytes read at once; replies to one chunk are at most as many

std::runtime_error socketError(const std::string& what) {
  return std::runtime_error(what + ": " + std::strerror(errno));
}

bool sendAll(int fd, const std::string& data) {
  size_t sent = 0;
  while (sent < data.size()) {
    const ssize_t n = ::send(fd, data.data() + sent, data.size() - sent, MSG_NOSIGNAL);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return false;  // gone, or took no replies within the send timeout
    sent += static_cast<size_t>(n);
  }
  return true;
}

}  // namespace

BitbangServer::BitbangServer(BitbangTarget& target, BitbangOptions options)
    : target_(target), options_(std::move(options)) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(options_.port);
  if (::inet_pton(AF_INET, options_.host.c_str(), &address.sin_addr) != 1) {
    throw std::runtime_error("not an IPv4 address: " + options_.host);
  }
  listenFd_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (listenFd_ < 0) throw socketError("socket");
  const int yes = 1;
  ::setsockopt(listenFd_, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
  if (::bind(listenFd_, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
      ::listen(listenFd_, 4) != 0) {
    const std::runtime_error error =
        socketError("cannot listen on " + options_.host + ":" + std::to_string(options_.port));
    ::close(listenFd_);
    throw error;
  }
  socklen_t length = sizeof address;
  ::getsockname(listenFd_, reinterpret_cast<sockaddr*>(&address), &length);
  port_ = ntohs(address.sin_port);
}

BitbangServer::~BitbangServer() {
  if (listenFd_ >= 0) ::close(listenFd_);
}

bool BitbangServer::run(const std::atomic<bool>& stop) {
  while (!stop) {
    pollfd waiting{listenFd_, POLLIN, 0};
    if (::poll(&waiting, 1, kPollMs) <= 0) continue;  // timeout, or a signal to look at `stop`
    const int fd = ::accept4(listenFd_, nullptr, nullptr, SOCK_CLOEXEC);
    if (fd < 0) continue;
    const int yes = 1;
    ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
    timeval sendTimeout{options_.sendTimeoutSeconds, 0};
    ::setsockopt(fd, SOL_SOCKET, SO_SNDTIMEO, &sendTimeout, sizeof sendTimeout);
    std::fprintf(stderr, "zinmox-rtlsim: client connected\n");
    const bool quit = serveClient(fd, stop);
    ::close(fd);
    std::fprintf(stderr, "zinmox-rtlsim: client %s (%llu unknown bytes ignored so far)\n",
                 quit ? "quit" : "left", static_cast<unsigned long long>(ignored_));
    if (quit) return true;
  }
  return false;
}

bool BitbangServer::serveClient(int fd, const std::atomic<bool>& stop) {
  using Clock = std::chrono::steady_clock;
  auto lastData = Clock::now();
  char buffer[kChunk];
  std::string replies;
  while (!stop) {
    pollfd client{fd, POLLIN, 0};
    const int ready = ::poll(&client, 1, kPollMs);
    if (ready <= 0) {
      const auto idle = std::chrono::duration_cast<std::chrono::seconds>(Clock::now() - lastData);
      if (options_.idleTimeoutSeconds > 0 && idle.count() >= options_.idleTimeoutSeconds) {
        std::fprintf(stderr, "zinmox-rtlsim: dropping a client idle for %d s\n",
                     options_.idleTimeoutSeconds);
        return false;
      }
      continue;
    }
    const ssize_t n = ::recv(fd, buffer, sizeof buffer, 0);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return false;  // the client closed or vanished
    lastData = Clock::now();
    replies.clear();
    const bool quit = handle(buffer, static_cast<size_t>(n), replies);
    if (!replies.empty() && !sendAll(fd, replies)) return false;
    if (quit) return true;
  }
  return false;
}

bool BitbangServer::handle(const char* data, size_t size, std::string& replies) {
  for (size_t i = 0; i < size; ++i) {
    const char c = data[i];
    if (c >= '0' && c <= '7') {
      const int v = c - '0';
      target_.setPins((v & 4) != 0, (v & 2) != 0, (v & 1) != 0);
    } else if (c == 'R') {
      replies.push_back(target_.tdo() ? '1' : '0');
    } else if (c >= 'r' && c <= 'u') {
      const int v = c - 'r';
      target_.setResets((v & 2) != 0, (v & 1) != 0);
    } else if (c == 'Q') {
      return true;
    } else if (c != 'B' && c != 'b') {
      ++ignored_;
    }
  }
  return false;
}

}  // namespace ZinRtl
