// Network endpoints as users write them: "HOST:PORT", "[v6-address]:PORT", "tcp://HOST:PORT" and
// "tls://HOST:PORT".
#ifndef ZINNET_ENDPOINT_H
#define ZINNET_ENDPOINT_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "ZinNet/ZinNet_Export.h"

namespace ZinNet {

/// A host name or address and a TCP port.
struct ZINNET_API Endpoint {
  std::string host;
  uint16_t port = 0;

  /// "HOST:PORT", with an IPv6 address in brackets.
  std::string text() const;
};

/// Reads "HOST:PORT" or "[ADDRESS]:PORT". Port 0 is accepted only when `allowAnyPort` is true
/// (a server then takes a free port). Throws std::invalid_argument naming the text and the fault.
ZINNET_API Endpoint parseEndpoint(std::string_view text, bool allowAnyPort = false);

/// Reads a target text: nothing when it does not start with "tcp://", else the endpoint after it
/// (port 0 is refused). Throws std::invalid_argument for a malformed "tcp://" text.
ZINNET_API std::optional<Endpoint> parseTcpTarget(std::string_view target);

/// The same for "tls://": a target server reached over TLS.
ZINNET_API std::optional<Endpoint> parseTlsTarget(std::string_view target);

}  // namespace ZinNet

#endif
