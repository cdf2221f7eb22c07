// The client's TLS handshake and its side of the token exchange.
#include <cstring>

#include "ClientChannel.h"
#include "TlsContext.h"
#include "TokenProof.h"
#include "ZinNet/Token.h"

namespace ZinNet {

using Protocol::MessageType;

void ClientChannel::startTls(Clock::time_point deadline) {
  if (!tls_) {
    try {
      tls_ = clientTlsContext(options_.tlsCaFile);
    } catch (const std::runtime_error& error) {
      fail(error.what());
    }
  }
  auto& tls = stream_.startTls(*tls_);
  expectServerName(tls, endpoint_.host);
  auto state = std::make_shared<OpState>();
  tls.async_handshake(asio::ssl::stream_base::client, [state](std::error_code ec) {
    state->done = true;
    state->ec = ec;
  });
  await(state, deadline, "the TLS handshake with " + endpoint_.text(), options_.connectTimeoutMs);
  if (state->ec) {
    fail("ZinNet: the TLS handshake with " + endpoint_.text() + " failed: " + state->ec.message() +
         " (does the server speak TLS, with a certificate for " + endpoint_.host +
         " that the client trusts?)");
  }
}

void ClientChannel::proveToken(const Nonce& clientNonce, Clock::time_point deadline) {
  const uint32_t ms = options_.connectTimeoutMs;
  const std::string what = "proving the token to " + endpoint_.text();
  try {
    checkToken(options_.token, "the client's options");
  } catch (const std::invalid_argument& error) {
    fail(error.what());
  }
  const Frame challenge = readFrame(deadline, what, ms);
  const std::string text(challenge.body.begin(), challenge.body.end());
  if (challenge.type == MessageType::Refused || challenge.type == MessageType::Closing) {
    fail("ZinNet: the server at " + endpoint_.text() + " did not take the token: " + text);
  }
  if (challenge.type != MessageType::TokenChallenge ||
      challenge.body.size() != Protocol::kNonceBytes + Protocol::kMacBytes) {
    fail("ZinNet: " + endpoint_.text() + " answered the token request with " +
         typeText(static_cast<uint8_t>(challenge.type)));
  }
  Nonce serverNonce{};
  std::memcpy(serverNonce.data(), challenge.body.data(), serverNonce.size());
  const Mac expected = serverMac(options_.token, clientNonce, serverNonce);
  if (!macMatches(expected, challenge.body.data() + serverNonce.size(), Protocol::kMacBytes)) {
    fail("ZinNet: the server at " + endpoint_.text() +
         " does not know the token (its proof is wrong); the connection was closed");
  }
  const Mac proof = clientMac(options_.token, serverNonce, clientNonce);
  writeAll(FrameWriter(MessageType::TokenProof).bytes(proof.data(), proof.size()).finish(),
           deadline, what, ms);
  const Frame answer = readFrame(deadline, what, ms);
  if (answer.type == MessageType::Closing) {
    fail("ZinNet: the server at " + endpoint_.text() +
         " refused the token: " + std::string(answer.body.begin(), answer.body.end()));
  }
  if (answer.type != MessageType::TokenAccepted) {
    fail("ZinNet: " + endpoint_.text() + " answered the token proof with " +
         typeText(static_cast<uint8_t>(answer.type)));
  }
}

}  // namespace ZinNet
