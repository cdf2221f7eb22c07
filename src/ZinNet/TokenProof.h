// The HMAC-SHA256 challenge and response that proves knowledge of the token without sending it.
//
//   client -> server  token request: client nonce Nc
//   server -> client  token challenge: server nonce Ns, HMAC(token, "ZNET server" Nc Ns)
//   client -> server  token proof: HMAC(token, "ZNET client" Ns Nc)
//   server -> client  token accepted, or a closing frame
//
// Each side's nonce is fresh per connection, so no recorded answer fits another connection, and
// the two labels keep one side's MAC from ever serving as the other's.
#ifndef ZINNET_SRC_TOKENPROOF_H
#define ZINNET_SRC_TOKENPROOF_H

#include <array>
#include <string>

#include "ZinNet/Protocol.h"

namespace ZinNet {

using Nonce = std::array<unsigned char, Protocol::kNonceBytes>;
using Mac = std::array<unsigned char, Protocol::kMacBytes>;

/// A nonce from OpenSSL's random generator. Throws std::runtime_error when it has none to give.
Nonce freshNonce();
/// What the server sends to show that it knows the token.
Mac serverMac(const std::string& token, const Nonce& client, const Nonce& server);
/// What the client sends to show that it knows the token.
Mac clientMac(const std::string& token, const Nonce& server, const Nonce& client);
/// Compares `mac` with `size` received bytes in constant time (false for a wrong size).
bool macMatches(const Mac& mac, const unsigned char* received, size_t size);

}  // namespace ZinNet

#endif
