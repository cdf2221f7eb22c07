// Beyond loopback: no request is served before the token is proven, a recorded proof fits no
// other connection, only loopback goes without a token unless told, and TLS carries it all.
#include <gtest/gtest.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>

#include "NetTestUtil.h"
#include "ZinNet/ZinNet.h"
#include "ZinRT/ZinJtag.h"

namespace {

using namespace ZinNetTest;

constexpr uint8_t kTokenRequest = 0x10, kTokenProof = 0x11, kChallenge = 0x90, kAccepted = 0x91;
const std::string kToken = "0123456789abcdef-test-token";

// The proof a client that knows the token sends, computed here independently of the library.
Bytes clientProof(const Bytes& serverNonce, const Bytes& clientNonce) {
  const Bytes message = concat({text("ZNET client"), serverNonce, clientNonce});
  Bytes mac(32);
  HMAC(EVP_sha256(), kToken.data(), static_cast<int>(kToken.size()), message.data(), message.size(),
       mac.data(), nullptr);
  return mac;
}

// Sends the hello with a token request; returns the nonce of the server's challenge.
Bytes challenge(RawClient& client, const Bytes& clientNonce) {
  client.send(concat({hello(), frame(kTokenRequest, clientNonce)}));
  client.readFrame();  // the welcome
  RawFrame got = client.readFrame().value_or(RawFrame{});
  EXPECT_TRUE(got.type == kChallenge && got.body.size() == 64) << "no token challenge";
  got.body.resize(32);
  return got.body;
}

// Opens a transport, reads the demo core's last input bits `times` times and disconnects.
std::string readFailure(ZinNet::ClientOptions options, uint16_t port, int times = 1) {
  return errorOf([&] {
    ZinNet::TcpTransport transport("127.0.0.1", port, options);
    unsigned char data[1] = {};
    for (int i = 0; i < times; ++i) transport.commandSequence("00 1 0 04 1 00000004 0", data, 4);
    transport.disconnect();  // an ordinary end, not a refused frame
  });
}

TEST(Security, NoRequestBeforeTheTokenIsProvenAndNoneWithoutOneBeyondLoopback) {
  TestServer server(std::make_shared<ZinSim::Target>(), {.token = kToken});
  const Bytes clientNonce(32, 0x5A);
  Bytes recorded;
  {
    RawClient client(server.port());
    recorded = clientProof(challenge(client, clientNonce), clientNonce);
    EXPECT_EQ(client.exchange(frame(kTokenProof, recorded)).type, kAccepted);
  }
  // The recorded proof replayed on a new connection, a wrong proof, a request without a proof,
  // a frame beyond what a token frame needs.
  for (const Bytes& proof : {recorded, Bytes(32, 0), Bytes{}, Bytes(64, 1)}) {
    RawClient client(server.port(), proof.size() != 32 ? 2 : 0);
    if (proof.size() == 32) challenge(client, clientNonce);
    const RawFrame reply =
        client.exchange(proof.empty() ? frame(kFlush) : frame(kTokenProof, proof));
    EXPECT_EQ(reply.type, kClosing) << reply.text();
  }
  EXPECT_EQ(server.server().stats().tokensRefused, 3u);
  EXPECT_THAT(server.log(), testing::Contains(HasSubstr("refused: wrong token")).Times(2));
  EXPECT_THAT(server.log(), testing::Each(testing::Not(HasSubstr(kToken))));

  ZinNet::ClientOptions options{2000, 2000};
  EXPECT_THAT(readFailure(options, server.port()), HasSubstr("requires a token"));
  options.token = "another-token-of-some-length";
  EXPECT_THAT(readFailure(options, server.port()), HasSubstr("does not know the token"));
  options.token = kToken;
  EXPECT_EQ(readFailure(options, server.port(), 2), "no failure");
  EXPECT_EQ(server.server().stats().requestsServed, 2u);  // those two reads, none before

  // Only loopback goes without a token, unless insecure.
  ZinNet::ServerOptions wide{.host = "0.0.0.0"};
  std::vector<std::string> log;
  wide.log = [&log](const std::string& line) { log.push_back(line); };
  EXPECT_THAT(errorOf<std::runtime_error>(
                  [&] { ZinNet::Server(std::make_shared<ZinSim::Target>(), wide).start(); }),
              HasSubstr("without a token"));
  wide.insecure = true;
  ZinNet::Server(std::make_shared<ZinSim::Target>(), wide).start();  // stops when destroyed
  EXPECT_THAT(log.front(), HasSubstr("WARNING: open to other machines without a token"));
  // A client with a token insists that the server proves it too.
  TestServer plain(std::make_shared<ZinSim::Target>());
  EXPECT_THAT(readFailure({2000, 2000, kToken}, plain.port()), HasSubstr("asks for no token"));
}

TEST(Security, TlsCarriesTheTokenAndChecksTheCertificate) {
  const ZinNet::ServerOptions options{.token = kToken,
                                      .tlsCertFile = ZIN_NET_TLS_DIR "/cert.pem",
                                      .tlsKeyFile = ZIN_NET_TLS_DIR "/key.pem"};
  TestServer server(std::make_shared<ZinSim::Target>(), options);
  ZinNet::ClientOptions client{2000, 2000, kToken, true, options.tlsCertFile};
  EXPECT_EQ(readFailure(client, server.port(), 2), "no failure");
  // C hosts reach the same server through the options of ZinNet_openSessionWith.
  const ZinNet_SessionOptions c{
      "127.0.0.1", server.port(), 2000, kToken.c_str(), 1, options.tlsCertFile.c_str()};
  const uint32_t handle = ZinNet_openSessionWith(&c);
  EXPECT_NE(handle, 0u) << ZinNet_lastError();
  ZinJtag_closeSession(handle);
  EXPECT_TRUE(server.waitUntilNoConnections(std::chrono::seconds(3)));
  EXPECT_EQ(server.server().stats().framesRefused, 0u);

  client.tlsCaFile = "";  // the system's authorities do not know the test certificate
  EXPECT_THAT(readFailure(client, server.port()), HasSubstr("certificate verify failed"));
  client.tls = false;
  EXPECT_THAT(readFailure(client, server.port()), HasSubstr("127.0.0.1"));
  EXPECT_EQ(server.server().stats().requestsServed, 2u);
}

}  // namespace
