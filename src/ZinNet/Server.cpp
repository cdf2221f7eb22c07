// The server: listener, accept loop, I/O thread, request thread, signals and shutdown.
#include "ZinNet/Server.h"

#include <algorithm>
#include <condition_variable>
#include <csignal>
#include <optional>
#include <stdexcept>
#include <thread>

#include "Asio.h"
#include "ServerConnection.h"
#include "ServerState.h"
#include "TlsContext.h"
#include "ZinNet/Token.h"

namespace ZinNet {

using asio::ip::tcp;

struct Server::Impl {
  Impl(std::shared_ptr<ZinRT::Zin_Transport> transport, ServerOptions options)
      : state(std::make_shared<ServerState>(std::move(transport), std::move(options))) {}

  void prepareSecurity();
  void listen();
  void accept();
  void onAccepted(std::error_code ec, tcp::socket socket);
  bool makeRoom();
  void watchSignals();
  void ioMain();

  std::shared_ptr<ServerState> state;
  // Declared after the state: the I/O objects go first, and with them every connection.
  asio::io_context io;
  asio::thread_pool requests{1};  // carries out the requests, one at a time, in arrival order
  std::optional<tcp::acceptor> acceptor;
  std::optional<asio::signal_set> signals;
  std::optional<asio::steady_timer> retry;
  std::thread ioThread;
  tcp::endpoint bound;
  uint64_t nextId = 1;
  std::vector<std::weak_ptr<ServerConnection>> connections;

  mutable std::mutex stateMutex;
  std::condition_variable stoppedChanged;
  bool started = false;
  bool ioDone = false;
  bool joined = false;
};

void Server::Impl::listen() {
  const ServerOptions& options = state->options;
  std::error_code ec;
  tcp::resolver resolver(io);
  const auto results =
      resolver.resolve(options.host, std::to_string(options.port), tcp::resolver::passive, ec);
  const std::string where = options.host + ":" + std::to_string(options.port);
  if (ec || results.empty()) {
    throw std::runtime_error("ZinNet: cannot listen on " + where + ": " +
                             (ec ? ec.message() : "no such address"));
  }
  const tcp::endpoint endpoint = results.begin()->endpoint();
  const bool open = !endpoint.address().is_loopback();
  if (open && options.token.empty() && !options.insecure) {
    throw std::runtime_error("ZinNet: refusing to listen on " + where +
                             " without a token: other machines could drive the target. Give a "
                             "token, or allow it knowingly (insecure)");
  }
  acceptor.emplace(io);
  acceptor->open(endpoint.protocol(), ec);
  if (!ec) acceptor->set_option(tcp::acceptor::reuse_address(true), ec);
  if (!ec) acceptor->bind(endpoint, ec);
  if (!ec) acceptor->listen(asio::socket_base::max_listen_connections, ec);
  if (!ec) bound = acceptor->local_endpoint(ec);
  if (ec) throw std::runtime_error("ZinNet: cannot listen on " + where + ": " + ec.message());
  const std::string guard = options.token.empty() ? "" : ", token required";
  const std::string tls = state->tls ? ", TLS" : "";
  state->log("listening on " + bound.address().to_string() + ":" + std::to_string(bound.port()) +
             (!open ? " (loopback only: other machines cannot connect" + guard + tls + ")"
              : options.token.empty()
                  ? " (WARNING: open to other machines without a token: whoever reaches this "
                    "port drives the target" +
                        tls + ")"
                  : " (open to other machines" + guard + tls + ")"));
}

void Server::Impl::prepareSecurity() {
  const ServerOptions& options = state->options;
  if (!options.token.empty()) {
    try {
      checkToken(options.token, "the server's options");
    } catch (const std::invalid_argument& error) {
      throw std::runtime_error(error.what());
    }
  }
  if (options.tlsCertFile.empty() != options.tlsKeyFile.empty()) {
    throw std::runtime_error("ZinNet: TLS needs both a certificate file and a key file");
  }
  if (!options.tlsCertFile.empty()) {
    state->tls = serverTlsContext(options.tlsCertFile, options.tlsKeyFile);
  }
}

void Server::Impl::accept() {
  acceptor->async_accept(asio::make_strand(io), [this](std::error_code ec, tcp::socket socket) {
    onAccepted(ec, std::move(socket));
  });
}

void Server::Impl::onAccepted(std::error_code ec, tcp::socket socket) {
  if (ec == asio::error::operation_aborted || !acceptor->is_open()) return;
  if (ec) {
    // Out of descriptors or a similar passing fault: try again a little later.
    state->log("accept failed: " + ec.message());
    retry.emplace(io, std::chrono::milliseconds(100));
    retry->async_wait([this](std::error_code e) {
      if (!e) accept();
    });
    return;
  }
  ++state->connectionsAccepted;
  auto connection = std::make_shared<ServerConnection>(state, std::move(socket),
                                                       requests.get_executor(), nextId++);
  std::erase_if(connections, [](const auto& weak) { return weak.expired(); });
  const auto placesTaken = std::count_if(connections.begin(), connections.end(), [](auto& weak) {
    const auto c = weak.lock();
    return c && c->holdsPlace();
  });
  const bool full = static_cast<uint64_t>(placesTaken) >= state->options.maxClients && !makeRoom();
  connections.push_back(connection);
  if (full) {
    connection->refuseAndClose("the server is busy: " + std::to_string(state->options.maxClients) +
                               " clients are connected");
  } else {
    connection->start();
  }
  accept();
}

// Closes the connection that has waited longest for its next request, if any connection is
// between requests; connections whose request is in progress keep their place.
bool Server::Impl::makeRoom() {
  std::shared_ptr<ServerConnection> oldest;
  std::chrono::steady_clock::time_point oldestSince{};
  for (const auto& weak : connections) {
    std::chrono::steady_clock::time_point since{};
    const auto c = weak.lock();
    if (c && c->evictable(since) && (!oldest || since < oldestSince)) {
      oldest = c;
      oldestSince = since;
    }
  }
  if (!oldest) return false;
  oldest->close("closed to make room for a new client: it had waited longest for a request");
  return true;
}

void Server::Impl::watchSignals() {
  signals.emplace(io, SIGINT, SIGTERM);
  signals->async_wait([this](std::error_code ec, int number) {
    if (ec) return;
    state->log(std::string("stopping on ") + (number == SIGINT ? "SIGINT" : "SIGTERM"));
    state->stopping = true;
    io.stop();
  });
}

void Server::Impl::ioMain() {
  try {
    io.run();
  } catch (const std::exception& e) {
    state->log(std::string("stopped by an error: ") + e.what());
  }
  state->stopping = true;
  std::lock_guard<std::mutex> lock(stateMutex);
  ioDone = true;
  stoppedChanged.notify_all();
}

Server::Server(std::shared_ptr<ZinRT::Zin_Transport> transport, ServerOptions options) {
  if (!transport) throw std::invalid_argument("ZinNet::Server: null transport");
  impl_ = std::make_unique<Impl>(std::move(transport), std::move(options));
}

Server::~Server() {
  stop();
}

void Server::start() {
  {
    std::lock_guard<std::mutex> lock(impl_->stateMutex);
    if (impl_->started) throw std::logic_error("ZinNet::Server: started twice");
    impl_->started = true;
  }
  try {
    impl_->prepareSecurity();
    impl_->listen();
  } catch (...) {
    std::lock_guard<std::mutex> lock(impl_->stateMutex);
    impl_->started = false;
    throw;
  }
  if (impl_->state->options.stopOnSignals) impl_->watchSignals();
  impl_->accept();
  impl_->ioThread = std::thread([impl = impl_.get()] { impl->ioMain(); });
}

void Server::stop() {
  {
    std::lock_guard<std::mutex> lock(impl_->stateMutex);
    if (!impl_->started || impl_->joined) return;
    impl_->joined = true;
  }
  impl_->state->stopping = true;
  impl_->io.stop();
  if (impl_->ioThread.joinable()) impl_->ioThread.join();
  impl_->requests.join();  // a request in progress finishes; the queued ones are skipped
  impl_->state->waiting.clear();
  // The I/O thread is gone: close what it left open, so clients see the end at once.
  std::error_code ec;
  if (impl_->acceptor) impl_->acceptor->close(ec);
  for (const auto& weak : impl_->connections) {
    if (auto connection = weak.lock()) connection->close("the server stopped");
  }
  impl_->connections.clear();
  impl_->state->log("stopped");
}

void Server::wait() {
  std::unique_lock<std::mutex> lock(impl_->stateMutex);
  impl_->stoppedChanged.wait(lock, [&] { return !impl_->started || impl_->ioDone; });
}

bool Server::isRunning() const {
  std::lock_guard<std::mutex> lock(impl_->stateMutex);
  return impl_->started && !impl_->ioDone;
}

uint16_t Server::port() const {
  return impl_->bound.port();
}

std::string Server::address() const {
  return impl_->bound.address().to_string() + ":" + std::to_string(impl_->bound.port());
}

ServerStats Server::stats() const {
  return impl_->state->snapshot();
}

void Server::withTransport(const std::function<void(ZinRT::Zin_Transport&)>& work) {
  std::lock_guard<std::mutex> lock(impl_->state->requestMutex);
  work(*impl_->state->transport);
}

}  // namespace ZinNet
