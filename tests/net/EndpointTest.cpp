// Endpoint texts as users write them on command lines and in Python.
#include <gtest/gtest.h>

#include "NetTestUtil.h"
#include "ZinNet/Endpoint.h"

namespace {

using ZinNet::parseEndpoint;
using ZinNet::parseTcpTarget;

TEST(Endpoint, HostPortFormsTcpTargetsAndTheirFaults) {
  EXPECT_EQ(parseEndpoint("127.0.0.1:7700").text(), "127.0.0.1:7700");
  EXPECT_EQ(parseEndpoint("localhost:1").port, 1);
  EXPECT_EQ(parseEndpoint("[::1]:65535").text(), "[::1]:65535");
  EXPECT_EQ(parseEndpoint("0.0.0.0:0", true).port, 0);
  for (const std::string bad :
       {"", ":7700", "host", "host:", "host:65536", "host:-1", "host:7x", "::1:7700", "[::1]7700",
        "[::1", "a b:1", "host:0", "host:123456"}) {
    EXPECT_THROW(parseEndpoint(bad), std::invalid_argument) << bad;
    EXPECT_THROW(parseTcpTarget("tcp://" + bad), std::invalid_argument) << bad;
  }
  EXPECT_EQ(ZinNetTest::errorOf<std::invalid_argument>([] { parseEndpoint("127.0.0.1"); }),
            "ZinNet: \"127.0.0.1\" is not HOST:PORT: missing ':PORT'");
  EXPECT_FALSE(parseTcpTarget("board.json").has_value());
  EXPECT_FALSE(parseTcpTarget("").has_value());
  EXPECT_EQ(parseTcpTarget("tcp://127.0.0.1:7700")->port, 7700);
  EXPECT_EQ(parseTcpTarget("tcp://[::1]:7700/")->host, "::1");
  EXPECT_FALSE(ZinNet::parseTlsTarget("tcp://127.0.0.1:7700").has_value());
  EXPECT_EQ(ZinNet::parseTlsTarget("tls://localhost:7700")->host, "localhost");
}

}  // namespace
