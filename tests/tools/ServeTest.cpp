// `zinmox serve` on an address other than loopback: a token is required, or --insecure with a
// warning; a client proves the token from its --token-file.
#include <gtest/gtest.h>

#include <signal.h>

#include <regex>

#include "ToolOutput.h"

namespace {

using zinmox_test::runTool;

TEST(Serve, AnOpenAddressNeedsATokenOrInsecure) {
  const std::string token = ZinTest::writeTempFile("serve_token", "0123456789abcdef-tool\n");
  ZinTest::ChildProcess server(ZINMOX_TOOL_PATH,
                               {"--token-file", token, "serve", "--listen", "0.0.0.0:0"});
  const std::string port = server.waitForMatch(
      std::regex("--target tcp://0\\.0\\.0\\.0:([0-9]+) and the token;"), 20000);
  ASSERT_FALSE(port.empty()) << server.output();
  const std::string target = "tcp://127.0.0.1:" + port;
  const auto read = runTool({"--target", target, "--token-file", token, "read", "0:1:0"});
  EXPECT_EQ(read.status, 0) << read.err;
  const auto refused = runTool({"--target", target, "scan"});
  EXPECT_EQ(refused.status, 1) << refused.err;
  EXPECT_NE(refused.err.find("this server requires a token"), std::string::npos) << refused.err;
  server.signal(SIGTERM);
  EXPECT_EQ(server.wait(10000), 0) << server.output();
  EXPECT_NE(server.output().find("refused: this server requires a token"), std::string::npos);

  ZinTest::ChildProcess open(ZINMOX_TOOL_PATH, {"serve", "--listen", "0.0.0.0:0", "--insecure"});
  EXPECT_TRUE(open.waitForOutput("SIGTERM stops", 20000)) << open.output();
  EXPECT_NE(open.output().find("WARNING: --insecure: no token is required"), std::string::npos);
  open.signal(SIGTERM);
  EXPECT_EQ(open.wait(10000), 0) << open.output();
}

}  // namespace
