// Beyond loopback: no request is served before the token is proven, a recorded proof fits no
// other connection, only loopback goes without a token unless told, and TLS carries it all.
#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>

#include <algorithm>

#include "NetTestUtil.h"
#include "ZinNet/TcpTransport.h"
#include "ZinNet/ZinNet.h"
#include "ZinRT/ZinJtag.h"

namespace {

using namespace ZinNetTest;

constexpr uint8_t kFlush = 0x04, kTokenRequest = 0x10, kTokenProof = 0x11;
constexpr uint8_t kChallenge = 0x90, kAccepted = 0x91, kClosing = 0xE2;
const std::string kToken = "0123456789abcdef-test-token";
const std::string kReadText = "00 1 0 04 1 00000004 0";  // the demo core's last input bits

ZinNet::ServerOptions tokenOptions() {
  ZinNet::ServerOptions options;
  options.token = kToken;
  return options;
}

// The proof a client that knows the token sends, computed here independently of the library.
Bytes clientProof(const Bytes& serverNonce, const Bytes& clientNonce) {
  const Bytes message = concat({text("ZNET client"), serverNonce, clientNonce});
  Bytes mac(32);
  unsigned int length = 0;
  HMAC(EVP_sha256(), kToken.data(), static_cast<int>(kToken.size()), message.data(), message.size(),
       mac.data(), &length);
  return mac;
}

// Sends the hello with a token request; returns the nonce of the server's challenge.
Bytes challenge(RawClient& client, const Bytes& clientNonce) {
  client.send(concat({hello(), frame(kTokenRequest, clientNonce)}));
  const auto welcome = client.readFrame();
  const auto challenge = client.readFrame();
  if (!welcome || !challenge || challenge->type != kChallenge || challenge->body.size() != 64) {
    ADD_FAILURE() << "no token challenge after the welcome";
    return {};
  }
  return Bytes(challenge->body.begin(), challenge->body.begin() + 32);
}

void readOnce(ZinNet::TcpTransport& transport) {
  unsigned char data[1] = {};
  transport.commandSequence(kReadText, data, 4);
}

std::string failureOf(ZinNet::ClientOptions options, uint16_t port) {
  try {
    ZinNet::TcpTransport transport("127.0.0.1", port, options);
    readOnce(transport);
  } catch (const ZinNet::NetError& error) {
    return error.what();
  }
  return "no failure";
}

TEST(Security, NoRequestIsServedBeforeTheTokenIsProven) {
  TestServer server(std::make_shared<ZinSim::Target>(), tokenOptions());
  const Bytes clientNonce(32, 0x5A);
  Bytes recorded;
  {
    RawClient client(server.port());
    recorded = clientProof(challenge(client, clientNonce), clientNonce);
    client.send(frame(kTokenProof, recorded));
    EXPECT_EQ(client.readFrame()->type, kAccepted);
  }
  // The recorded proof replayed on a new connection, a wrong proof, a request without a proof,
  // a frame beyond what a token frame needs.
  for (const Bytes& proof : {recorded, Bytes(32, 0), Bytes{}, Bytes(64, 1)}) {
    RawClient client(server.port());
    if (proof.size() != 32) {
      client.greet();
      client.send(proof.empty() ? frame(kFlush) : frame(kTokenProof, proof));
    } else {
      challenge(client, clientNonce);
      client.send(frame(kTokenProof, proof));
    }
    const auto reply = client.readFrame();
    ASSERT_TRUE(reply);
    EXPECT_EQ(reply->type, kClosing) << reply->text();
  }
  EXPECT_EQ(server.server().stats().tokensRefused, 3u);
  EXPECT_EQ(server.server().stats().requestsServed, 0u);
  const auto log = server.log();
  EXPECT_EQ(std::count_if(log.begin(), log.end(),
                          [](auto& l) { return l.find("refused: wrong token") != l.npos; }),
            2);
  for (const auto& line : log) EXPECT_EQ(line.find(kToken), std::string::npos) << line;

  ZinNet::ClientOptions options{2000, 2000};
  EXPECT_NE(failureOf(options, server.port()).find("requires a token"), std::string::npos);
  options.token = "another-token-of-some-length";
  EXPECT_NE(failureOf(options, server.port()).find("does not know the token"), std::string::npos);
  options.token = kToken;
  ZinNet::TcpTransport transport("127.0.0.1", server.port(), options);
  readOnce(transport);
  readOnce(transport);
  EXPECT_EQ(server.server().stats().requestsServed, 2u);
}

TEST(Security, OnlyLoopbackGoesWithoutATokenUnlessInsecure) {
  ZinNet::ServerOptions options;
  options.host = "0.0.0.0";
  std::vector<std::string> log;
  options.log = [&log](const std::string& line) { log.push_back(line); };
  try {
    ZinNet::Server(std::make_shared<ZinSim::Target>(), options).start();
    ADD_FAILURE() << "an open address without a token was served";
  } catch (const std::runtime_error& error) {
    EXPECT_NE(std::string(error.what()).find("without a token"), std::string::npos);
  }
  options.insecure = true;
  ZinNet::Server open(std::make_shared<ZinSim::Target>(), options);
  open.start();
  open.stop();
  EXPECT_NE(log.front().find("WARNING: open to other machines without a token"), std::string::npos);
  // A client with a token insists that the server proves it too.
  TestServer plain(std::make_shared<ZinSim::Target>());
  ZinNet::ClientOptions client{2000, 2000, kToken};
  EXPECT_NE(failureOf(client, plain.port()).find("asks for no token"), std::string::npos);
}

TEST(Security, TlsCarriesTheTokenAndChecksTheCertificate) {
  ZinNet::ServerOptions options = tokenOptions();
  options.tlsCertFile = ZIN_NET_TLS_DIR "/cert.pem";
  options.tlsKeyFile = ZIN_NET_TLS_DIR "/key.pem";
  TestServer server(std::make_shared<ZinSim::Target>(), options);
  ZinNet::ClientOptions client{2000, 2000, kToken, true, options.tlsCertFile};
  ZinNet::TcpTransport transport("127.0.0.1", server.port(), client);
  readOnce(transport);
  readOnce(transport);
  EXPECT_EQ(server.server().stats().requestsServed, 2u);
  // C hosts reach the same server through the options of ZinNet_openSessionWith.
  const ZinNet_SessionOptions c{
      "127.0.0.1", server.port(), 2000, kToken.c_str(), 1, options.tlsCertFile.c_str()};
  const uint32_t handle = ZinNet_openSessionWith(&c);
  EXPECT_NE(handle, 0u) << ZinNet_lastError();
  ZinJtag_closeSession(handle);
  transport.disconnect();  // an ordinary end, not a refused frame
  EXPECT_TRUE(server.waitUntilNoConnections(std::chrono::seconds(3)));
  EXPECT_EQ(server.server().stats().framesRefused, 0u);

  client.tlsCaFile = "";  // the system's authorities do not know the test certificate
  EXPECT_NE(failureOf(client, server.port()).find("certificate verify failed"), std::string::npos);
  client.tls = false;
  EXPECT_NE(failureOf(client, server.port()).find("127.0.0.1"), std::string::npos);
  EXPECT_EQ(server.server().stats().requestsServed, 2u);
}

}  // namespace
