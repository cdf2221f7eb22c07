// Parsing of "HOST:PORT", "[ADDRESS]:PORT" and "tcp://HOST:PORT" or "tls://HOST:PORT".
#include "ZinNet/Endpoint.h"

#include <stdexcept>

namespace ZinNet {

namespace {

[[noreturn]] void fail(std::string_view text, const std::string& fault) {
  throw std::invalid_argument("ZinNet: \"" + std::string(text) + "\" is not HOST:PORT: " + fault);
}

uint16_t parsePort(std::string_view digits, std::string_view text, bool allowAnyPort) {
  if (digits.empty() || digits.size() > 5) fail(text, "the port must be 1 to 5 digits");
  uint32_t port = 0;
  for (char c : digits) {
    if (c < '0' || c > '9') fail(text, "the port must be decimal");
    port = port * 10 + static_cast<uint32_t>(c - '0');
  }
  if (port > 65535) fail(text, "the port must be at most 65535");
  if (port == 0 && !allowAnyPort) fail(text, "port 0 is not a server's port");
  return static_cast<uint16_t>(port);
}

}  // namespace

std::string Endpoint::text() const {
  const bool v6 = host.find(':') != std::string::npos;
  return (v6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

Endpoint parseEndpoint(std::string_view text, bool allowAnyPort) {
  Endpoint endpoint;
  std::string_view rest;
  if (!text.empty() && text.front() == '[') {
    const size_t close = text.find(']');
    if (close == std::string_view::npos) fail(text, "missing ']'");
    endpoint.host = std::string(text.substr(1, close - 1));
    rest = text.substr(close + 1);
    if (rest.empty() || rest.front() != ':') fail(text, "missing ':' after ']'");
    rest.remove_prefix(1);
  } else {
    const size_t colon = text.rfind(':');
    if (colon == std::string_view::npos) fail(text, "missing ':PORT'");
    endpoint.host = std::string(text.substr(0, colon));
    if (endpoint.host.find(':') != std::string::npos) {
      fail(text, "write an IPv6 address in brackets");
    }
    rest = text.substr(colon + 1);
  }
  if (endpoint.host.empty()) fail(text, "the host is empty");
  for (char c : endpoint.host) {
    if (static_cast<unsigned char>(c) <= ' ' || c == '/' || c == '[' || c == ']') {
      fail(text, "the host holds a blank, '/' or a bracket");
    }
  }
  endpoint.port = parsePort(rest, text, allowAnyPort);
  return endpoint;
}

namespace {

std::optional<Endpoint> parseSchemeTarget(std::string_view target, std::string_view scheme) {
  if (target.substr(0, scheme.size()) != scheme) return std::nullopt;
  std::string_view rest = target.substr(scheme.size());
  if (!rest.empty() && rest.back() == '/') rest.remove_suffix(1);
  return parseEndpoint(rest, false);
}

}  // namespace

std::optional<Endpoint> parseTcpTarget(std::string_view target) {
  return parseSchemeTarget(target, "tcp://");
}

std::optional<Endpoint> parseTlsTarget(std::string_view target) {
  return parseSchemeTarget(target, "tls://");
}

}  // namespace ZinNet
