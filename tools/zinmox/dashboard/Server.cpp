// The dashboard's web server.
#include "Server.h"

#include <httplib.h>

#include <stdexcept>

#include "Api.h"
#include "Assets.h"

namespace zinmox::dashboard {

namespace {

bool isLoopback(const std::string& host) {
  return host == "127.0.0.1" || host == "localhost" || host == "::1";
}

bool isWildcard(const std::string& host) {
  return host == "0.0.0.0" || host == "::";
}

std::string bracketed(const std::string& host) {
  return host.find(':') != std::string::npos ? "[" + host + "]" : host;
}

bool changesState(const std::string& method) {
  return method != "GET" && method != "HEAD";
}

bool isJson(const std::string& contentType) {
  const std::string type = contentType.substr(0, contentType.find(';'));
  return type == "application/json";
}

}  // namespace

Server::Server(HostLink& host, std::string listenHost, uint16_t port)
    : host_(host),
      hub_(host),
      listenHost_(std::move(listenHost)),
      port_(port),
      http_(std::make_unique<httplib::Server>()) {}

Server::~Server() {
  stop();
}

std::string Server::address() const {
  return bracketed(listenHost_) + ":" + std::to_string(port_);
}

bool Server::allowedHost(const std::string& hostHeader) const {
  if (isWildcard(listenHost_)) return true;  // every address of the machine is ours
  const std::string port = ":" + std::to_string(port_);
  if (hostHeader == address()) return true;
  return isLoopback(listenHost_) &&
         (hostHeader == "localhost" + port || hostHeader == "127.0.0.1" + port ||
          hostHeader == "[::1]" + port);
}

void Server::start() {
  http_->new_task_queue = [] { return new httplib::ThreadPool(kMaxLiveViews + kRequestWorkers); };
  http_->set_payload_max_length(kMaxBodyBytes);
  http_->set_read_timeout(kIdleSeconds, 0);
  http_->set_write_timeout(kIdleSeconds, 0);
  http_->set_keep_alive_timeout(kIdleSeconds);
  addRoutes();
  if (port_ == 0) {
    const int bound = http_->bind_to_any_port(listenHost_);
    if (bound <= 0) throw std::runtime_error("cannot listen on " + address());
    port_ = static_cast<uint16_t>(bound);
  } else if (!http_->bind_to_port(listenHost_, port_)) {
    throw std::runtime_error("cannot listen on " + address() + ": in use or not an address here");
  }
  hub_.start();
  thread_ = std::thread([this] { http_->listen_after_bind(); });
}

void Server::stop() {
  hub_.stop();
  http_->stop();
  if (thread_.joinable()) thread_.join();
}

void Server::addRoutes() {
  // Requests for another host name (a page of another site resolving its name to us), writes
  // from another origin and writes that are not JSON are refused before any route runs.
  http_->set_pre_routing_handler([this](const httplib::Request& req, httplib::Response& res) {
    const std::string hostHeader = req.get_header_value("Host");
    if (!allowedHost(hostHeader)) {
      setError(res, 403,
               "refused: the Host header '" + hostHeader.substr(0, 64) +
                   "' does not name this dashboard (" + address() + ")");
      return httplib::Server::HandlerResponse::Handled;
    }
    if (changesState(req.method)) {
      const std::string origin = req.get_header_value("Origin");
      if (req.has_header("Origin") && origin != "http://" + hostHeader) {
        setError(res, 403,
                 "cross-origin write refused: Origin '" + origin.substr(0, 64) +
                     "' is not http://" + hostHeader);
        return httplib::Server::HandlerResponse::Handled;
      }
      if (!isJson(req.get_header_value("Content-Type"))) {
        setError(res, 415, "writes must be sent as Content-Type: application/json");
        return httplib::Server::HandlerResponse::Handled;
      }
    }
    return httplib::Server::HandlerResponse::Unhandled;
  });
  http_->set_error_handler([](const httplib::Request&, httplib::Response& res) {
    if (!res.body.empty()) return;
    const std::string reason =
        res.status == 413   ? "the body is larger than " + std::to_string(kMaxBodyBytes) + " bytes"
        : res.status == 404 ? "no such page or API route"
                            : "the request cannot be served";
    setError(res, res.status, reason);
  });
  for (size_t i = 0; i < kAssetCount; ++i) {
    const Asset& asset = kAssets[i];
    auto serve = [asset](const httplib::Request&, httplib::Response& res) {
      res.set_header("Cache-Control", "no-cache");
      res.set_content(asset.body.data(), asset.body.size(), std::string(asset.type).c_str());
    };
    http_->Get(std::string(asset.path), serve);
    if (asset.path == "/index.html") http_->Get("/", serve);
  }
  addApiRoutes(*http_, host_, hub_);
  addEvents();
}

void Server::addEvents() {
  http_->Get("/api/events", [this](const httplib::Request&, httplib::Response& res) {
    if (liveViews_.fetch_add(1) >= kMaxLiveViews) {
      liveViews_.fetch_sub(1);
      return setError(res, 503,
                      "too many live views: at most " + std::to_string(kMaxLiveViews) +
                          " pages may follow the reads at once");
    }
    res.set_header("Cache-Control", "no-store");
    auto seen = std::make_shared<uint64_t>(0);
    auto lastSeq = std::make_shared<uint64_t>(0);
    res.set_chunked_content_provider(
        "text/event-stream",
        [this, seen, lastSeq](size_t, httplib::DataSink& sink) {
          if (hub_.stopped()) return false;
          const HubState state =
              hub_.wait(*seen, *lastSeq, std::chrono::seconds(1), kMaxSamplesPerEvent);
          if (state.generation == *seen) {
            // A comment keeps the connection alive and shows when the page has gone.
            return sink.write(": idle\n\n", 8);
          }
          *seen = state.generation;
          if (!state.samples.empty()) *lastSeq = state.samples.back().seq;
          const std::string event = eventText(state, host_.version());
          return sink.write(event.data(), event.size());
        },
        [this](bool) { liveViews_.fetch_sub(1); });
  });
}

}  // namespace zinmox::dashboard
