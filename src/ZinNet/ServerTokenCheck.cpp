// The server's side of the token exchange: until the client has proven that it knows the token,
// a connection takes a token request and then a token proof, and nothing else.
#include <cstring>

#include "RequestHandler.h"
#include "ServerConnection.h"

namespace ZinNet {

using Protocol::MessageType;

void ServerConnection::onTokenStep(const Frame& frame) {
  if (frame.type == MessageType::TokenRequest && !challenged_) {
    onTokenRequest(frame);
  } else if (frame.type == MessageType::TokenProof && challenged_) {
    onTokenProof(frame);
  } else {
    refuseToken("this server requires a token: the client must prove that it knows it before " +
                typeText(static_cast<uint8_t>(frame.type)));
  }
}

void ServerConnection::onTokenRequest(const Frame& frame) {
  if (frame.body.size() != clientNonce_.size()) {
    refuseToken("a token request holds a " + std::to_string(clientNonce_.size()) +
                "-byte nonce, not " + std::to_string(frame.body.size()) + " bytes");
    return;
  }
  std::memcpy(clientNonce_.data(), frame.body.data(), clientNonce_.size());
  try {
    serverNonce_ = freshNonce();
  } catch (const std::runtime_error& error) {
    refuse(error.what(), true);
    return;
  }
  challenged_ = true;
  const Mac mac = serverMac(state_->options.token, clientNonce_, serverNonce_);
  FrameWriter out(MessageType::TokenChallenge);
  send(out.bytes(serverNonce_.data(), serverNonce_.size()).bytes(mac.data(), mac.size()).finish(),
       false);
}

void ServerConnection::onTokenProof(const Frame& frame) {
  const Mac expected = clientMac(state_->options.token, serverNonce_, clientNonce_);
  if (!macMatches(expected, frame.body.data(), frame.body.size())) {
    refuseToken("wrong token");
    return;
  }
  admitted_ = true;
  state_->log("connection " + std::to_string(id_) + " from " + peer_ + ": token accepted");
  send(FrameWriter(MessageType::TokenAccepted).finish(), false);
}

void ServerConnection::refuseToken(const std::string& why) {
  ++state_->tokensRefused;
  state_->log("connection " + std::to_string(id_) + " from " + peer_ + " refused: " + why);
  leaving_ = true;
  send(textFrame(MessageType::Closing, why), true);
}

}  // namespace ZinNet
